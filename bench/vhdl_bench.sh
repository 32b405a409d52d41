#!/bin/sh
# Reads generated VHDL netlists (many entities with component instances and port maps, the
# wanted entity last) through a whole pinforge run with a one-line template, and prints the
# rate and the peak resident memory for each size. Two sizes show whether the cost is linear.
# Usage: sh bench/vhdl_bench.sh <pinforge-binary> [megabytes ...]   (default: 10 100)
set -eu
if [ "$#" -lt 1 ]; then
  echo "usage: sh bench/vhdl_bench.sh <pinforge-binary> [megabytes ...]" >&2
  exit 2
fi
pinforge=$1
shift
sizes=${*:-10 100}
here=$(cd "$(dirname "$0")" && pwd)
out=$here/out
mkdir -p "$out"
printf '%%module%%\n' > "$out/vhdl_one_line.tmpl"

for mb in $sizes; do
  netlist=$out/vhdl_netlist_$mb.vhd
  awk -v mb="$mb" -f "$here/vhdl_netlist_gen.awk" > "$netlist"
  bytes=$(wc -c < "$netlist")
  # Best of three, so a burst of load on the shared machine spoils little; the file is in
  # the page cache after the first run, as it is for a designer's second run.
  for round in 1 2 3; do
    /usr/bin/time -v -o "$out/vhdl_time.$round" "$pinforge" -lib work "$netlist" -module top \
      -prj p -template "$out/vhdl_one_line.tmpl" -o "$out/vhdl_out.txt" > "$out/vhdl_run.log" || {
      cat "$out/vhdl_run.log" >&2
      exit 1
    }
  done
  if [ "$(cat "$out/vhdl_out.txt")" != "top" ]; then
    echo "vhdl_bench: entity top was not found in $netlist" >&2
    exit 1
  fi
  awk -v bytes="$bytes" -v mb="$mb" '
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
      printf "vhdl_bench: %.1f MB netlist: %.2f s wall (%.0f MB/s), %.2f s CPU (%.0f MB/s), peak RSS %.1f MB (limit %.1f MB)%s\n",
        bytes / 1e6, bestWall, bytes / 1e6 / bestWall, bestCpu, bytes / 1e6 / bestCpu,
        peak / 1024, limit / 1024, (peak > limit ? " OVER LIMIT" : "")
    }' "$out"/vhdl_time.1 "$out"/vhdl_time.2 "$out"/vhdl_time.3
  rm -f "$netlist"
done
