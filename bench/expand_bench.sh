#!/bin/sh
# Expands the buses of an entity into single bits, once as a port list and once as an
# iteration, and prints the wall time, the CPU time (steadier on a busy machine) and the peak
# memory of each run. The default entity has
# 1000 buses of 1000 bits (a million bits); a last run with one bus of a million bits shows
# the cost of a single large expansion.
# Usage: sh bench/expand_bench.sh <pinforge-binary> [buses] [bits-per-bus]
set -eu
here=$(cd "$(dirname "$0")" && pwd)
. "$here/lib.sh"
bench_start "[buses] [bits-per-bus]" "$@"
buses=${2:-1000}
bits=${3:-1000}

entity() {
  awk -v n="$1" -v w="$2" 'BEGIN {
    print "entity expand_bench is"
    print "  port ("
    for (i = 0; i < n; i++)
      printf "    b%06d : in bit_vector(%d downto 0)%s\n", i, w - 1, (i + 1 < n ? ";" : "")
    print "  );"
    print "end entity expand_bench;"
  }' > "$out/expand_bench.vhd"
}

run() {
  printf '%s' "$1" > "$out/expand_bench.tmpl"
  timing=$out/expand_bench.time
  start=$(date +%s.%N)
  if [ -x /usr/bin/time ]; then
    /usr/bin/time -f "%U %S %M" -o "$timing" "$pinforge" -lib work "$out/expand_bench.vhd" \
      -module expand_bench -prj bench -template "$out/expand_bench.tmpl" \
      -o "$out/expand_bench.txt" > "$out/expand_bench.log"
  else
    "$pinforge" -lib work "$out/expand_bench.vhd" -module expand_bench -prj bench \
      -template "$out/expand_bench.tmpl" -o "$out/expand_bench.txt" > "$out/expand_bench.log"
    echo "? ? ?" > "$timing"
  fi
  end=$(date +%s.%N)
  read -r user system peak < "$timing"
  awk -v s="$start" -v e="$end" -v n="$2" -v w="$3" -v u="$user" -v y="$system" -v m="$peak" \
    -v t="$1" 'BEGIN {
    printf "expand_bench: %d x %d bits, %s\n  wall %.3f s, cpu %s s user + %s s system, peak %s kB\n",
      n, w, t, e - s, u, y, m
  }'
}

entity "$buses" "$bits"
run '@EXPANDBUS@%port%' "$buses" "$bits"
run '@EXPANDBUS@@ITERATE@%PORT%@ITERATOR@ : @VHDL_TYPEDEC@@ENDITERATE@' "$buses" "$bits"
entity 1 $((buses * bits))
run '@EXPANDBUS@%port%' 1 $((buses * bits))
