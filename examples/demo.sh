#!/bin/sh
# Runs every bundled template on the three example designs and says where the results are.
# Usage: sh examples/demo.sh <pinforge-binary> [output-directory]   (default: build/demo)
set -eu

if [ "$#" -lt 1 ]; then
  echo "usage: sh examples/demo.sh <pinforge-binary> [output-directory]" >&2
  exit 2
fi
case "$1" in
  /*) pinforge=$1 ;;
  *) pinforge=$(pwd)/$1 ;;
esac
if [ ! -x "$pinforge" ]; then
  echo "demo: $1 is not an executable; build first (make)" >&2
  exit 1
fi

cd "$(dirname "$0")/.."
out=${2:-build/demo}
mkdir -p "$out"
if command -v tclsh >/dev/null 2>&1; then have_tcl=yes; else have_tcl=no; fi

# run <module> <template> <output> <design files...>
run() {
  module=$1 template=$2 output=$3
  shift 3
  if ! log=$("$pinforge" -lib work "$@" -module "$module" -prj pinforge_demo \
      -template "$template" -o "$out/$output"); then
    printf '%s\n' "$log" >&2
    echo "demo: $template on $module failed" >&2
    exit 1
  fi
  echo "  $template -> $out/$output"
}

# tcl <module> <template> <output> <design files...>: a Tcl template, when Tcl is installed.
tcl() {
  if [ "$have_tcl" = yes ]; then
    run "$@"
  else
    echo "  $2 skipped: tclsh is not installed (Debian package tcl)"
  fi
}

# data_templates <module> <design files...>: the language-neutral templates.
data_templates() {
  module=$1
  shift
  run "$module" pins "${module}_pins.txt" "$@"
  tcl "$module" port_table "${module}_ports.txt" "$@"
  tcl "$module" ports_json "${module}.json" "$@"
  tcl "$module" ports_csv "${module}.csv" "$@"
  tcl "$module" ports_markdown "${module}.md" "$@"
  tcl "$module" symbol_svg "${module}.svg" "$@"
  tcl "$module" xdc_pins "${module}.xdc" "$@"
  run "$module" cocotb_test "test_${module}.py" "$@"
}

# vhdl_templates <module> <design files...>
vhdl_templates() {
  module=$1
  shift
  echo "$module ($*):"
  run "$module" vhdl_component "${module}_component.vhd" "$@"
  run "$module" vhdl_instance "${module}_instance.vhd" "$@"
  run "$module" vhdl_component_instance "${module}_component_instance.vhd" "$@"
  run "$module" vhdl_signals "${module}_signals.vhd" "$@"
  run "$module" vhdl_wrapper "${module}_wrapper.vhd" "$@"
  run "$module" vhdl_testbench "tb_${module}.vhd" "$@"
  data_templates "$module" "$@"
}

# verilog_templates <module> <design files...>
verilog_templates() {
  module=$1
  shift
  echo "$module ($*):"
  run "$module" verilog_instance "${module}_instance.sv" "$@"
  run "$module" verilog_wrapper "${module}_wrapper.sv" "$@"
  run "$module" sv_testbench "tb_${module}.sv" "$@"
  data_templates "$module" "$@"
}

vhdl_templates uart_tx examples/uart/uart_pkg.vhd examples/uart/uart_tx.vhd
vhdl_templates gpio_bank examples/gpio/gpio_bank.vhd
verilog_templates sync_fifo examples/fifo/sync_fifo.sv
echo "Outputs are in $(cd "$out" && pwd)"
