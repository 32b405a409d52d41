#!/bin/sh
# Runs every template in templates/ on the UART example and says where the results are.
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

run() {
  template=$1
  output=$2
  if ! log=$("$pinforge" -lib work examples/uart/uart_pkg.vhd examples/uart/uart_tx.vhd \
      -module uart_tx -prj uart_demo -template "templates/$template" -o "$out/$output"); then
    printf '%s\n' "$log" >&2
    echo "demo: $template failed" >&2
    exit 1
  fi
  echo "  $template -> $out/$output"
}

echo "pinforge demo: entity uart_tx from examples/uart/"
run vhdl_component.tmpl uart_tx_component.vhd
run vhdl_instance.tmpl uart_tx_instance.vhd
run pins.txt.tmpl uart_tx_pins.txt
if command -v tclsh >/dev/null 2>&1; then
  run port_table.tcl uart_tx_ports.txt
else
  echo "  port_table.tcl skipped: tclsh is not installed (Debian package tcl)"
fi
echo "Outputs are in $(cd "$out" && pwd)"
