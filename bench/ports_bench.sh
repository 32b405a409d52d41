#!/bin/sh
# Runs a 100,000-port entity through a template that lists every port three ways and prints
# the run time and the output rate. Usage: sh bench/ports_bench.sh <pinforge-binary> [ports]
set -eu
if [ "$#" -lt 1 ]; then
  echo "usage: sh bench/ports_bench.sh <pinforge-binary> [ports]" >&2
  exit 2
fi
pinforge=$1
ports=${2:-100000}
here=$(cd "$(dirname "$0")" && pwd)
out=$here/out
mkdir -p "$out"

awk -v n="$ports" -f "$here/ports_gen.awk" > "$out/ports_bench.vhd"
start=$(date +%s.%N)
"$pinforge" -lib work "$out/ports_bench.vhd" -module ports_bench -prj bench \
  -template "$here/ports_bench.tmpl" -o "$out/ports_bench.txt" > "$out/ports_bench.log"
end=$(date +%s.%N)

bytes=$(wc -c < "$out/ports_bench.txt")
awk -v s="$start" -v e="$end" -v b="$bytes" -v p="$ports" 'BEGIN {
  t = e - s
  if (t <= 0) t = 0.000001
  printf "ports_bench: %d ports, %.1f MB of output in %.3f s: %.1f MB/s\n", p, b / 1e6, t, b / 1e6 / t
}'
