#!/bin/sh
# Runs every bench/*_bench.sh with the pinforge binary given as the first argument.
set -eu
if [ "$#" -lt 1 ]; then
  echo "usage: sh bench/run.sh <pinforge-binary>" >&2
  exit 2
fi
case "$1" in
  /*) pinforge=$1 ;;
  *) pinforge=$(pwd)/$1 ;;
esac
status=0
for bench in "$(dirname "$0")"/*_bench.sh; do
  sh "$bench" "$pinforge" || status=1
done
exit $status
