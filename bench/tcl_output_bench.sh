#!/bin/sh
# Runs a Tcl template whose script shell prints a great deal (1.5 GB by default) and then
# fails, and prints pinforge's time and peak RSS: only the end of that output is kept for the
# failure message, so the peak must stay far below the output's size.
# Usage: sh bench/tcl_output_bench.sh <pinforge-binary> [bytes]
set -eu
here=$(cd "$(dirname "$0")" && pwd)
. "$here/lib.sh"
bench_start "[bytes]" "$@"
bytes=${2:-1500000000}

# runscr is taken from beside the program, so a copy of the program gets a noisy one.
bin=$out/tcl_output_bin
mkdir -p "$bin"
cp "$pinforge" "$bin/pinforge"
cat > "$bin/runscr" <<'SH'
#!/bin/sh
head -c "$BENCH_BYTES" /dev/zero | tr '\0' x
exit 1
SH
chmod +x "$bin/runscr"
cat > "$out/tcl_output.vhd" <<'VHDL'
entity tcl_output is
  port (clk : in bit);
end entity tcl_output;
VHDL
printf 'puts unused\n' > "$out/tcl_output.tcl"

BENCH_BYTES=$bytes /usr/bin/time -v -o "$out/tcl_output_time" "$bin/pinforge" \
  -lib work "$out/tcl_output.vhd" -module tcl_output -prj bench \
  -template "$out/tcl_output.tcl" -o "$out/tcl_output.txt" \
  > "$out/tcl_output.log" 2> "$out/tcl_output.err" || true
if ! grep -q "Unable to invoke tcl file generator" "$out/tcl_output.log"; then
  echo "tcl_output_bench: the run did not end as expected" >&2
  cat "$out/tcl_output.log" >&2
  exit 1
fi
awk -v bytes="$bytes" '
  /Elapsed \(wall clock\)/ {
    n = split($NF, part, ":"); s = 0
    for (i = 1; i <= n; i++) s = s * 60 + part[i]
  }
  /Maximum resident set size/ { rss = $NF }
  END {
    limit = 64 * 1024
    printf "tcl_output_bench: %.1f MB of script output: %.2f s wall, peak RSS %.1f MB (limit %.1f MB)%s\n",
      bytes / 1e6, s, rss / 1024, limit / 1024, (rss > limit ? " OVER LIMIT" : "")
    if (rss > limit) exit 1
  }' "$out/tcl_output_time"
