#!/bin/sh
# Runs every template in templates/ on the two example designs and says where the results are.
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
      -template "templates/$template" -o "$out/$output"); then
    printf '%s\n' "$log" >&2
    echo "demo: $template on $module failed" >&2
    exit 1
  fi
  echo "  $template -> $out/$output"
}

# every_template <module> <design files...>
every_template() {
  module=$1
  shift
  echo "$module ($*):"
  run "$module" vhdl_component.tmpl "${module}_component.vhd" "$@"
  run "$module" vhdl_instance.tmpl "${module}_instance.vhd" "$@"
  run "$module" pins.txt.tmpl "${module}_pins.txt" "$@"
  if [ "$have_tcl" = yes ]; then
    run "$module" port_table.tcl "${module}_ports.txt" "$@"
  else
    echo "  port_table.tcl skipped: tclsh is not installed (Debian package tcl)"
  fi
}

every_template uart_tx examples/uart/uart_pkg.vhd examples/uart/uart_tx.vhd
every_template gpio_bank examples/gpio/gpio_bank.vhd
echo "Outputs are in $(cd "$out" && pwd)"
