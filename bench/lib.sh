# Shared by the bench/*_bench.sh scripts: the argument check, the output directory and the
# best-of-three timing with its summary line. Source it after setting `here` to the bench
# directory; `bench_start` then sets `pinforge` and `out`.

# Checks that the pinforge binary was given, then sets `pinforge` and creates `$out`.
# Usage: bench_start "<argument synopsis after the binary>" "$@"
bench_start() {
  bench_synopsis=$1
  shift
  if [ "$#" -lt 1 ]; then
    echo "usage: sh bench/$(basename "$0") <pinforge-binary> $bench_synopsis" >&2
    exit 2
  fi
  pinforge=$1
  out=$here/out
  mkdir -p "$out"
}

# Runs a command three times, so a burst of load on the shared machine spoils little, each
# under /usr/bin/time -v into $out/<name>_time.<round>; stops the script when a run fails.
# Usage: bench_best_of_three <name> <command> [argument ...]
bench_best_of_three() {
  bench_name=$1
  shift
  for bench_round in 1 2 3; do
    /usr/bin/time -v -o "$out/${bench_name}_time.$bench_round" "$@" \
      > "$out/${bench_name}_run.log" || {
      cat "$out/${bench_name}_run.log" >&2
      exit 1
    }
  done
}

# Prints the best wall and CPU seconds and the peak RSS of /usr/bin/time -v reports for a
# netlist of the given size; `checked` marks a peak above the memory target as OVER LIMIT.
# Usage: bench_summary <bytes> <label> checked|unchecked <report> [report ...]
bench_summary() {
  bench_bytes=$1
  bench_label=$2
  bench_check=$3
  shift 3
  awk -v bytes="$bench_bytes" -v label="$bench_label" -v check="$bench_check" '
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
        peak / 1024, limit / 1024, (check == "checked" && peak > limit ? " OVER LIMIT" : "")
    }' "$@"
}
