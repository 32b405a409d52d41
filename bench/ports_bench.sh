#!/bin/sh
# Runs a 100,000-port entity through a template that lists every port three ways and prints
# the run time and the output rate. A second run with a one-line template measures what
# reading the design costs, so the rate of the template step itself can be told apart.
# A last row runs 200,000 ports through name tests inside an iteration and one @MAPSIGNAL per
# port, which must stay linear in the number of ports.
# Times are CPU seconds (user + system) of pinforge, which a busy machine disturbs less than
# wall-clock time. Usage: sh bench/ports_bench.sh <pinforge-binary> [ports]
set -eu
here=$(cd "$(dirname "$0")" && pwd)
. "$here/lib.sh"
bench_start "[ports]" "$@"
ports=${2:-100000}

awk -v n="$ports" -f "$here/ports_gen.awk" > "$out/ports_bench.vhd"
printf '%%module%%\n' > "$out/ports_baseline.tmpl"

# Records the CPU time used so far by finished children of this shell (in this shell: a
# command substitution would only see its own children).
mark() { times > "$out/times.$1"; }

run() {
  "$pinforge" -lib work "${3:-$out/ports_bench.vhd}" -module ports_bench -prj bench \
    -template "$1" -o "$2" > "$out/ports_bench.log" || {
    cat "$out/ports_bench.log" >&2
    exit 1
  }
}

# Three rounds, alternating, and the best of each kind, so a burst of load on the machine
# spoils little.
mark 0
for round in 1 2 3; do
  run "$out/ports_baseline.tmpl" "$out/ports_baseline.txt"
  mark $((round * 2 - 1))
  run "$here/ports_bench.tmpl" "$out/ports_bench.txt"
  mark $((round * 2))
done

bytes=$(wc -c < "$out/ports_bench.txt")
awk -v b="$bytes" -v p="$ports" '
  FNR == 2 {
    split($1, u, /[ms]/); split($2, s, /[ms]/)
    t[n++] = u[1] * 60 + u[2] + s[1] * 60 + s[2]
  }
  END {
    base = full = 1e9
    for (i = 0; i + 2 < n; i += 2) {
      if (t[i + 1] - t[i] < base) base = t[i + 1] - t[i]
      if (t[i + 2] - t[i + 1] < full) full = t[i + 2] - t[i + 1]
    }
    printf "ports_bench: %d ports, %.1f MB of output, whole run %.3f s CPU (reading the design %.3f s)\n", p, b / 1e6, full, base
    if (full - base > 0.001)
      printf "ports_bench: template step %.3f s: %.1f MB/s\n", full - base, b / 1e6 / (full - base)
    else
      printf "ports_bench: template step below timer resolution\n"
  }' "$out"/times.0 "$out"/times.1 "$out"/times.2 "$out"/times.3 "$out"/times.4 "$out"/times.5 "$out"/times.6

search_ports=200000
awk -v n="$search_ports" -f "$here/ports_gen.awk" > "$out/ports_search.vhd"
awk -v n="$search_ports" -f "$here/ports_bench_search.awk" > "$out/ports_search.tmpl"
mark 7
run "$out/ports_search.tmpl" "$out/ports_search.txt" "$out/ports_search.vhd"
mark 8
awk -v p="$search_ports" '
  FNR == 2 {
    split($1, u, /[ms]/); split($2, s, /[ms]/)
    t[n++] = u[1] * 60 + u[2] + s[1] * 60 + s[2]
  }
  END { printf "ports_bench: %d ports, name tests in an iteration and a mapping per port: %.3f s CPU\n", p, t[1] - t[0] }
' "$out/times.7" "$out/times.8"
