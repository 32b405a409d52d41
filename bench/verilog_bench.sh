#!/bin/sh
# Reads generated gate-level Verilog netlists (cell instances with escaped names, the wanted
# top module last with a 500-port non-ANSI header) through a whole pinforge run with a
# one-line template, and prints the rate and the peak resident memory for each size; two
# sizes show whether the cost is linear. For comparison the smallest file also goes once
# through `yosys -p read_verilog` when yosys is installed (on 100 MB yosys needs minutes and
# gigabytes, which a shared machine cannot spare; its rate per MB is what compares).
# Usage: sh bench/verilog_bench.sh <pinforge-binary> [megabytes ...]   (default: 10 100)
set -eu
if [ "$#" -lt 1 ]; then
  echo "usage: sh bench/verilog_bench.sh <pinforge-binary> [megabytes ...]" >&2
  exit 2
fi
pinforge=$1
shift
sizes=${*:-10 100}
here=$(cd "$(dirname "$0")" && pwd)
out=$here/out
mkdir -p "$out"
printf '%%module%%\n' > "$out/verilog_one_line.tmpl"

# Best-of-three figures from /usr/bin/time -v reports: wall and CPU seconds, peak RSS in kB.
summarize() {
  bytes=$1
  label=$2
  shift 2
  awk -v bytes="$bytes" -v label="$label" '
    /Elapsed \(wall clock\)/ {
      n = split($NF, part, ":"); s = 0
      for (i = 1; i <= n; i++) s = s * 60 + part[i]
      wall[FILENAME] = s
    }
    /User time/ { cpu[FILENAME] += $NF }
    /System time/ { cpu[FILENAME] += $NF }
    /Maximum resident set size/ { rss[FILENAME] = $NF }
    END {
      bestWall = bestCpu = 1e9
      for (f in wall) {
        if (wall[f] < bestWall) bestWall = wall[f]
        if (cpu[f] < bestCpu) bestCpu = cpu[f]
        if (rss[f] > peak) peak = rss[f]
      }
      if (bestWall < 0.01) bestWall = 0.01
      if (bestCpu < 0.01) bestCpu = 0.01
      limit = bytes / 1024 + 64 * 1024
      printf "%s: %.1f MB netlist: %.2f s wall (%.0f MB/s), %.2f s CPU (%.0f MB/s), peak RSS %.1f MB (limit %.1f MB)%s\n",
        label, bytes / 1e6, bestWall, bytes / 1e6 / bestWall, bestCpu, bytes / 1e6 / bestCpu,
        peak / 1024, limit / 1024, (label == "verilog_bench" && peak > limit ? " OVER LIMIT" : "")
    }' "$@"
}

first=
for mb in $sizes; do
  netlist=$out/verilog_netlist_$mb.v
  python3 "$here/verilog_netlist_gen.py" "$mb" "$netlist"
  bytes=$(wc -c < "$netlist")
  # The file is in the page cache after generation, as it is for a designer's second run.
  for round in 1 2 3; do
    /usr/bin/time -v -o "$out/verilog_time.$round" "$pinforge" -lib work "$netlist" \
      -lang verilog -module top -prj p -template "$out/verilog_one_line.tmpl" \
      -o "$out/verilog_out.txt" > "$out/verilog_run.log" || {
      cat "$out/verilog_run.log" >&2
      exit 1
    }
  done
  if [ "$(cat "$out/verilog_out.txt")" != "top" ]; then
    echo "verilog_bench: module top was not found in $netlist" >&2
    exit 1
  fi
  summarize "$bytes" verilog_bench "$out"/verilog_time.1 "$out"/verilog_time.2 "$out"/verilog_time.3
  if [ -z "$first" ]; then first=$netlist; else rm -f "$netlist"; fi
done

if command -v yosys > /dev/null 2>&1; then
  bytes=$(wc -c < "$first")
  /usr/bin/time -v -o "$out/verilog_yosys.time" yosys -q -p "read_verilog $first" \
    > "$out/verilog_yosys.log" 2>&1 || true
  summarize "$bytes" "yosys read_verilog" "$out/verilog_yosys.time"
else
  echo "verilog_bench: yosys not installed; no comparison"
fi
rm -f "$first"
