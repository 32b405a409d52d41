#!/bin/sh
# Reads generated gate-level Verilog netlists (cell instances with escaped names, the wanted
# top module last with a 500-port non-ANSI header) through a whole pinforge run with a
# one-line template, and prints the rate and the peak resident memory for each size; two
# sizes show whether the cost is linear. For comparison the smallest file also goes once
# through `yosys -p read_verilog` when yosys is installed (on 100 MB yosys needs minutes and
# gigabytes, which a shared machine cannot spare; its rate per MB is what compares).
# Usage: sh bench/verilog_bench.sh <pinforge-binary> [megabytes ...]   (default: 10 100)
set -eu
here=$(cd "$(dirname "$0")" && pwd)
. "$here/lib.sh"
bench_start "[megabytes ...]" "$@"
shift
sizes=${*:-10 100}
printf '%%module%%\n' > "$out/verilog_one_line.tmpl"

first=
for mb in $sizes; do
  netlist=$out/verilog_netlist_$mb.v
  python3 "$here/verilog_netlist_gen.py" "$mb" "$netlist"
  bytes=$(wc -c < "$netlist")
  # The file is in the page cache after generation, as it is for a designer's second run.
  bench_best_of_three verilog "$pinforge" -lib work "$netlist" -lang verilog -module top \
    -prj p -template "$out/verilog_one_line.tmpl" -o "$out/verilog_out.txt"
  if [ "$(cat "$out/verilog_out.txt")" != "top" ]; then
    echo "verilog_bench: module top was not found in $netlist" >&2
    exit 1
  fi
  bench_summary "$bytes" verilog_bench checked "$out"/verilog_time.1 "$out"/verilog_time.2 "$out"/verilog_time.3
  if [ -z "$first" ]; then first=$netlist; else rm -f "$netlist"; fi
done

if command -v yosys > /dev/null 2>&1; then
  bytes=$(wc -c < "$first")
  /usr/bin/time -v -o "$out/verilog_yosys.time" yosys -q -p "read_verilog $first" \
    > "$out/verilog_yosys.log" 2>&1 || true
  bench_summary "$bytes" "yosys read_verilog" unchecked "$out/verilog_yosys.time"
else
  echo "verilog_bench: yosys not installed; no comparison"
fi
rm -f "$first"
