#!/bin/sh
# Reads generated VHDL netlists (many entities with component instances and port maps, the
# wanted entity last) through a whole pinforge run with a one-line template, and prints the
# rate and the peak resident memory for each size. Two sizes show whether the cost is linear.
# Usage: sh bench/vhdl_bench.sh <pinforge-binary> [megabytes ...]   (default: 10 100)
set -eu
here=$(cd "$(dirname "$0")" && pwd)
. "$here/lib.sh"
bench_start "[megabytes ...]" "$@"
shift
sizes=${*:-10 100}
printf '%%module%%\n' > "$out/vhdl_one_line.tmpl"

for mb in $sizes; do
  netlist=$out/vhdl_netlist_$mb.vhd
  awk -v mb="$mb" -f "$here/vhdl_netlist_gen.awk" > "$netlist"
  bytes=$(wc -c < "$netlist")
  # The file is in the page cache after the first run, as it is for a designer's second run.
  bench_best_of_three vhdl "$pinforge" -lib work "$netlist" -module top -prj p \
    -template "$out/vhdl_one_line.tmpl" -o "$out/vhdl_out.txt"
  if [ "$(cat "$out/vhdl_out.txt")" != "top" ]; then
    echo "vhdl_bench: entity top was not found in $netlist" >&2
    exit 1
  fi
  bench_summary "$bytes" vhdl_bench checked "$out"/vhdl_time.1 "$out"/vhdl_time.2 "$out"/vhdl_time.3
  rm -f "$netlist"
done
