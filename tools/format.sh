#!/bin/sh
# Formats every C++ file in the repository with .clang-format, or with --check only reports the
# files that differ (exit status 1), as CI does.
set -eu
cd "$(dirname "$0")/.."
format=${CLANG_FORMAT:-clang-format}
files=$(git ls-files '*.cpp' '*.h')
if [ "${1:-}" = "--check" ]; then
  # shellcheck disable=SC2086
  exec "$format" --dry-run --Werror $files
fi
# shellcheck disable=SC2086
exec "$format" -i $files
