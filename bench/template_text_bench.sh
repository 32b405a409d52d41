#!/bin/sh
# Streams a large template (mostly plain text, with header variables, fixed characters and
# delimiter-equal text that takes part in wrapping) through the engine and prints the run
# time and the rate in MB of template read per second.
# Usage: sh bench/template_text_bench.sh <pinforge-binary> [lines]
set -eu
here=$(cd "$(dirname "$0")" && pwd)
. "$here/lib.sh"
bench_start "[lines]" "$@"
lines=${2:-1000000}

cat > "$out/text_bench.vhd" <<'VHDL'
entity text_bench is
  port (clk : in bit; q : out bit);
end entity text_bench;
VHDL
awk -v n="$lines" 'BEGIN {
  print "@SET OUTLINEWIDTH=60@"
  for (i = 0; i < n; i++) {
    if (i % 10 == 0) print "-- %module% line " i "@TAB@of %project%, %title%@PERCENT@"
    else print "  signal s" i " : std_logic_vector(31 downto 0); -- plain text only"
  }
}' > "$out/text_bench.tmpl"

start=$(date +%s.%N)
"$pinforge" -lib work "$out/text_bench.vhd" -module text_bench -prj bench \
  -template "$out/text_bench.tmpl" -o "$out/text_bench.txt" > "$out/text_bench.log"
end=$(date +%s.%N)

bytes=$(wc -c < "$out/text_bench.tmpl")
awk -v s="$start" -v e="$end" -v b="$bytes" 'BEGIN {
  t = e - s
  if (t <= 0) t = 0.000001
  printf "template_text_bench: %.1f MB of template in %.3f s: %.1f MB/s\n", b / 1e6, t, b / 1e6 / t
}'
