#!/bin/sh
# Tests the Windows build under Wine:
#  1. the Windows test binaries (ctest in the Windows build folder runs each under wine);
#  2. the golden cases, run by the Linux test binary against pinforge.exe on files in the Wine
#     prefix: output must be byte-identical;
#  3. the Tcl path with a stand-in runscr.exe: the driver script pinforge.exe hands over must
#     equal the one the Linux program writes for the same run;
#  4. drive-letter paths, and CRLF design, template and response files.
# Usage: tools/test-windows.sh [windows-build-folder] [linux-build-folder]
set -eu

source_dir=$(cd "$(dirname "$0")/.." && pwd)
win_build=$(cd "${1:-build-windows}" && pwd)
native_build=$(cd "${2:-build}" && pwd)

export WINEDEBUG=-all
# No Mono or Gecko: the prefix is made without asking to download them.
export WINEDLLOVERRIDES="mscoree,mshtml="
export WINEPREFIX="${WINEPREFIX:-$win_build/wine}"

# The first Wine process starts the background services; they keep whatever output they were
# given, so they get none, or they would hold the test runners' pipes open. The server stays up
# between runs instead of starting a new session for each.
# The server is started first: one that wineboot started would not stay.
mkdir -p "$WINEPREFIX"
wineserver -p60 >/dev/null 2>&1 </dev/null || true
wineboot -i >/dev/null 2>&1 </dev/null
wine cmd /c exit >/dev/null 2>&1 </dev/null

failures=0
fail() {
  echo "FAILED: $*" >&2
  failures=$((failures + 1))
}

echo "== Windows test binaries"
# The install check drives a Linux install; the Windows layout is made by make dist-windows.
# A case that names a Linux device (/dev/zero) means nothing on Windows; under Wine the name
# even reaches the Linux device.
(cd "$win_build" && GTEST_FILTER='-*IncludeDevice*' ctest --output-on-failure -E '^install_') ||
  fail "Windows test binaries"

work="$WINEPREFIX/drive_c/pinforge-tests"
rm -rf "$work"
mkdir -p "$work"
work_win='C:\pinforge-tests'

echo "== Golden cases against pinforge.exe"
# The Tcl cases need a Tcl shell, which the Wine prefix does not have; part 3 covers that path.
# The command-line tests are left out: they name Linux devices such as /dev/full.
TMPDIR="$work" PINFORGE_BIN="$source_dir/tools/windows/wine-pinforge" \
  PINFORGE_WINDOWS_EXE="$win_build/pinforge.exe" PINFORGE_SOURCE_DIR="$source_dir" \
  "$native_build/test_core" --gtest_brief=1 \
  --gtest_filter='Cases/GoldenTest.*:-*tcl_*' || fail "golden cases"

# Copies a golden case's material (its shared designs, then its own files) into folder $2.
material() {
  case_dir="$source_dir/tests/golden/$1"
  mkdir -p "$2"
  if [ -f "$case_dir/designs" ]; then
    for design in $(cat "$case_dir/designs"); do
      cp -R "$source_dir/tests/golden/designs/$design/." "$2"
    done
  fi
  for entry in "$case_dir"/*; do
    case "${entry##*/}" in
      args | requires | designs | expect | expect.*) ;;
      *) cp -R "$entry" "$2" ;;
    esac
  done
}

# Runs pinforge.exe in folder $1 with the remaining arguments; output to $1.out/.err/.status.
run_windows() {
  dir=$1
  shift
  status=0
  (cd "$dir" && wine "$work/bin-win/pinforge.exe" "$@") >"$dir.out" 2>"$dir.err" </dev/null ||
    status=$?
  echo "$status" >"$dir.status"
}

# The same with the Linux program.
run_linux() {
  dir=$1
  shift
  status=0
  (cd "$dir" && "$work/bin-linux/pinforge" "$@") >"$dir.out" 2>"$dir.err" </dev/null ||
    status=$?
  echo "$status" >"$dir.status"
}

same() {
  cmp -s "$1" "$2" || fail "$3: $1 and $2 differ"
}

mkdir -p "$work/bin-win" "$work/bin-linux"
cp "$win_build/pinforge.exe" "$win_build/standin/runscr.exe" "$work/bin-win/"
cp "$native_build/pinforge" "$work/bin-linux/"
cat >"$work/bin-linux/runscr" <<'STANDIN'
#!/bin/sh
# Linux twin of the Windows stand-in: keeps the driver script as driver.tcl.
[ "$#" -eq 1 ] && cp "$1" driver.tcl && echo "runscr stand-in: $(wc -c <"$1") bytes"
STANDIN
chmod +x "$work/bin-linux/runscr"

echo "== Tcl path with the stand-in runscr"
for case_dir in "$source_dir"/tests/golden/tcl_*; do
  name=${case_dir##*/}
  for side in win linux; do
    material "$name" "$work/tcl/$name/$side"
  done
  # shellcheck disable=SC2046  # args holds whitespace-separated words, no quoting
  run_windows "$work/tcl/$name/win" $(cat "$case_dir/args")
  # shellcheck disable=SC2046
  PATH="$work/bin-linux:$PATH" run_linux "$work/tcl/$name/linux" $(cat "$case_dir/args")
  [ "$(cat "$work/tcl/$name/win.status")" = 0 ] || fail "$name: pinforge.exe failed: $(cat "$work/tcl/$name/win.out" "$work/tcl/$name/win.err")"
  same "$work/tcl/$name/win/driver.tcl" "$work/tcl/$name/linux/driver.tcl" "$name driver script"
  same "$work/tcl/$name/win.out" "$work/tcl/$name/linux.out" "$name standard output"
done

echo "== Drive letters in the output path"
paths="$work/paths"
material flow_title_vhd "$paths"
mkdir -p "$paths/out"
printf 'title=%%title%%\r\next=%%ext%%\r\nfile=%%filename%%\r\n' >"$paths/drive.txt"
run_windows "$paths" -lib work design.vhd -module top -prj demo -template drive.txt \
  -o "$work_win\\paths\\out\\top_inst.vhd"
printf 'title=top_inst\r\next=vhd\r\nfile=%s\\paths\\out\\top_inst.vhd\r\n' "$work_win" \
  >"$work/paths.expected"
same "$paths/out/top_inst.vhd" "$work/paths.expected" "drive-letter output path"

echo "== Names beyond ASCII"
# "été" and "日本": UTF-8 on the command line, in the file system through UTF-16.
names="$work/names"
material flow_title_vhd "$names"
mv "$names/design.vhd" "$names/$(printf 'd\303\251sign.vhd')"
mv "$names/t.txt" "$names/$(printf '\346\227\245\346\234\254.txt')"
run_windows "$names" -lib work "$(printf 'd\303\251sign.vhd')" -module top -prj demo \
  -template "$(printf '\346\227\245\346\234\254.txt')" -o "$(printf '\303\251t\303\251.vhd')"
sed "s/^title=top/title=$(printf '\303\251t\303\251')/; s/top\.vhd/$(printf '\303\251t\303\251').vhd/" \
  "$source_dir/tests/golden/flow_title_vhd/expect/top.vhd" >"$work/names.expected"
same "$names/$(printf '\303\251t\303\251.vhd')" "$work/names.expected" "non-ASCII names"

echo "== CRLF design, template and response files"
crlf() { sed 's/$/\r/' "$1" >"$1.crlf" && mv "$1.crlf" "$1"; }
for case_name in flow_title_vhd engine_handlers_port_lists; do
  args=$(cat "$source_dir/tests/golden/$case_name/args")
  for side in lf-win crlf-win crlf-linux; do
    dir="$work/crlf/$case_name/$side"
    material "$case_name" "$dir"
    # shellcheck disable=SC2086
    printf '%s\n' $args >"$dir/args.rsp"
    case $side in crlf-*) crlf "$dir/design.vhd" && crlf "$dir/args.rsp" ;; esac
  done
  base="$work/crlf/$case_name"
  run_windows "$base/lf-win" @args.rsp
  run_windows "$base/crlf-win" @args.rsp
  run_linux "$base/crlf-linux" @args.rsp
  out=$(sed -n 's/.*-o \([^ ]*\).*/\1/p' "$source_dir/tests/golden/$case_name/args")
  same "$base/lf-win/$out" "$source_dir/tests/golden/$case_name/expect/$out" "$case_name, LF"
  same "$base/crlf-win/$out" "$base/lf-win/$out" "$case_name, CRLF design and response file"
  same "$base/crlf-linux/$out" "$base/crlf-win/$out" "$case_name, CRLF on Linux and Windows"
done
# A CRLF template gives CRLF output: template text is copied as bytes.
dir="$work/crlf/template"
material flow_title_vhd "$dir"
crlf "$dir/t.txt"
run_windows "$dir" -lib work design.vhd -module top -prj demo -template t.txt -o top.vhd
sed 's/$/\r/' "$source_dir/tests/golden/flow_title_vhd/expect/top.vhd" >"$dir.expected"
same "$dir/top.vhd" "$dir.expected" "CRLF template"

if [ "$failures" -ne 0 ]; then
  echo "test-windows: $failures failure(s)" >&2
  exit 1
fi
echo "test-windows: all passed"
