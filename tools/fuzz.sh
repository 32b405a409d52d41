#!/bin/sh
# Runs every fuzz target of a fuzz build folder for the given number of seconds, one after
# the other (the machine is shared). Each target starts from the committed seeds in
# fuzz/corpus/<target>/ and grows its own corpus in <build>/corpus/<target>/, so the
# committed seeds stay small; crashes land in <build>/artifacts/. Prints one summary line per
# target and fails when any target found a crash, a leak or a timeout.
# Usage: tools/fuzz.sh <fuzz build folder> <seconds per target>
set -u
if [ "$#" -ne 2 ]; then
  echo "usage: tools/fuzz.sh <fuzz build folder> <seconds per target>" >&2
  exit 2
fi
build=$1
seconds=$2
source_dir=$(cd "$(dirname "$0")/.." && pwd)
mkdir -p "$build/artifacts" || exit 1

status=0
summary=""
for target in "$build"/fuzz/*_fuzz; do
  [ -x "$target" ] || continue
  name=$(basename "$target")
  mkdir -p "$build/corpus/$name" || exit 1
  log="$build/$name.log"
  echo "== $name: $seconds s (log: $log)"
  # Diagnostics printed by the code under test are noise here; libFuzzer's own report
  # still goes to the log.
  "$target" "$build/corpus/$name" "$source_dir/fuzz/corpus/$name" \
    -max_total_time="$seconds" -timeout=20 -rss_limit_mb=2048 -print_final_stats=1 \
    -artifact_prefix="$build/artifacts/$name-" >"$log" 2>&1
  result=$?
  runs=$(sed -n 's/^stat::number_of_executed_units: *//p' "$log" | tail -n 1)
  edges=$(grep -o 'cov: [0-9]*' "$log" | tail -n 1 | sed 's/cov: //')
  line="$name: ${runs:-?} runs in $seconds s, ${edges:-?} edges, exit $result"
  echo "$line"
  summary="$summary$line
"
  if [ "$result" -ne 0 ]; then
    status=1
    tail -n 40 "$log"
  fi
done
printf '\nfuzzing summary\n%s' "$summary"
exit $status
