#!/usr/bin/env bash
# Installs the build into a scratch prefix (component "pinforge", so the build folder's own
# install_manifest.txt is left alone), checks what was installed and that it works from another
# folder, then uninstalls and checks that the prefix is as empty as before.
# Usage: install_test.sh <build folder> <source folder> <built pinforge>
set -u
build=$(cd "$1" && pwd) || exit 1
source=$(cd "$2" && pwd) || exit 1
built=$3
scratch=$(mktemp -d "${TMPDIR:-/tmp}/pinforge-install-XXXXXX") || exit 1
trap 'rm -rf "$scratch"' EXIT
prefix=$scratch/prefix
mkdir -p "$prefix" "$scratch/elsewhere"
failures=0

fail() {
  echo "FAIL: $*" >&2
  failures=$((failures + 1))
}

cmake --install "$build" --prefix "$prefix" --component pinforge >"$scratch/install.log" 2>&1 \
  || { cat "$scratch/install.log" >&2; echo "FAIL: install" >&2; exit 1; }
manifest=$build/install_manifest_pinforge.txt

# --- What is installed -------------------------------------------------------------------
for file in bin/pinforge bin/runscr share/doc/pinforge/README.md share/man/man1/pinforge.1 \
  share/bash-completion/completions/pinforge; do
  [ -f "$prefix/$file" ] || fail "$file is not installed"
done
for file in bin/pinforge bin/runscr; do
  [ -x "$prefix/$file" ] || fail "$file is not executable"
done
for doc in "$source"/docs/*.md; do
  [ -f "$prefix/share/doc/pinforge/${doc##*/}" ] || fail "docs/${doc##*/} is not installed"
done
[ -e "$prefix/share/doc/pinforge/pinforge.1" ] && fail "the man page is installed as a doc too"
templates=()
for template in "$source"/templates/*; do
  name=${template##*/}
  templates+=("$name")
  cmp -s "$template" "$prefix/share/pinforge/templates/$name" \
    || fail "template $name is not installed as it is in templates/"
done
[ ${#templates[@]} -gt 0 ] || fail "no templates in $source/templates"

# --- The installed program works from another folder, its Tcl path included -------------
# Templates are given by name, so the installed program must find its own library.
design=$source/examples/uart
for template in vhdl_instance port_table; do
  (cd "$scratch/elsewhere" && env -u PINFORGE_TEMPLATE_PATH "$prefix/bin/pinforge" -lib work \
    "$design/uart_pkg.vhd" "$design/uart_tx.vhd" -module uart_tx -prj install_check \
    -template "$template" -o "out_$template.txt") \
    >"$scratch/run.log" 2>&1
  status=$?
  if [ $status -ne 0 ] || ! grep -q uart_tx "$scratch/elsewhere/out_$template.txt"; then
    cat "$scratch/run.log" >&2
    fail "installed pinforge with $template: status $status"
  fi
done
rm -rf "$scratch/elsewhere"

# --- The man page renders and names every switch -----------------------------------------
page=$prefix/share/man/man1/pinforge.1
if command -v man >/dev/null 2>&1; then
  rendered=$(LC_ALL=C MANWIDTH=200 man -l "$page" 2>"$scratch/man.err" | col -b)
elif command -v groff >/dev/null 2>&1; then
  rendered=$(LC_ALL=C groff -man -Tascii "$page" 2>"$scratch/man.err" | col -b)
else
  fail "neither man nor groff is installed (Debian packages man-db, groff)"
  rendered=
fi
[ -s "$scratch/man.err" ] && fail "the man page renders with warnings: $(cat "$scratch/man.err")"
[ ${#rendered} -gt 2000 ] || fail "the rendered man page is too short (${#rendered} bytes)"
# The switches the program's own usage line names, plus the ones around it.
usage=$("$built" -h)
switches=$(printf '%s\n' "$usage" | grep -oE '(^|[[ ])--?[A-Za-z?]+' | tr -d '[ ' | sort -u)
[ -n "$switches" ] || fail "no switches found in the usage line: $usage"
for switch in $switches -g -D -I -lang --list --help --version -h -help '-?'; do
  pattern=$(printf '%s' "$switch" | sed 's/[?]/[?]/g')
  printf '%s\n' "$rendered" | grep -qE -- "(^|[^A-Za-z-])$pattern([^A-Za-z]|\$)" \
    || fail "the man page does not name $switch"
done
for language in vhdl verilog systemverilog sv; do
  printf '%s\n' "$rendered" | grep -qw -- "$language" || fail "the man page misses -lang $language"
done

# --- Completion offers switches, -lang values and template names --------------------------
mkdir -p "$scratch/own"
: >"$scratch/own/my_table.tmpl"
: >"$scratch/own/my_script.tcl"
# Runs in the scratch folder, whose file names begin with none of the words completed here.
complete_words() {
  (cd "$scratch" && PATH="$prefix/bin:$PATH" PINFORGE_TEMPLATE_PATH="$scratch/own" bash --norc --noprofile -c '
    source "$1/share/bash-completion/completions/pinforge" || exit 1
    shift
    COMP_WORDS=("$@")
    COMP_CWORD=$(($# - 1))
    _pinforge
    printf "%s\n" "${COMPREPLY[@]}"' complete "$prefix" "$@")
}
offered=$(complete_words pinforge -template '')
for template in "${templates[@]}" my_table.tmpl my_script.tcl; do
  name=${template%.tmpl}
  name=${name%.tcl}
  printf '%s\n' "$offered" | grep -qxF -- "$name" || fail "completion does not offer template $name"
done
# A program that cannot be run: the names come from the folders the completion file knows.
offered=$(complete_words no-such-pinforge -template '')
for template in "${templates[@]}" my_table.tmpl; do
  name=${template%.tmpl}
  name=${name%.tcl}
  printf '%s\n' "$offered" | grep -qxF -- "$name" \
    || fail "completion without a runnable program does not offer template $name"
done
offered=$(complete_words pinforge -lib work x.vhd -template my_)
[ "$(printf '%s\n' "$offered" | sort | tr '\n' ' ')" = "my_script my_table " ] \
  || fail "completion of -template my_ offers: $offered"
offered=$(complete_words pinforge -lang '')
[ "$(printf '%s\n' "$offered" | sort | tr '\n' ' ')" = "sv systemverilog verilog vhdl " ] \
  || fail "completion of -lang offers: $offered"
offered=$(complete_words pinforge --)
for switch in --nodelist --a --inc --list --help --version; do
  printf '%s\n' "$offered" | grep -qxF -- "$switch" || fail "completion does not offer $switch"
done
offered=$(complete_words pinforge -)
for switch in $switches -g -D -I; do
  printf '%s\n' "$offered" | grep -qxF -- "$switch" || fail "completion does not offer $switch"
done

# --- Uninstall removes exactly what was installed ----------------------------------------
: >"$prefix/keep.txt"
cmake -DMANIFEST="$manifest" -P "$source/cmake/PinforgeUninstall.cmake" >"$scratch/uninstall.log" 2>&1 \
  || { cat "$scratch/uninstall.log" >&2; fail "uninstall"; }
left=$(cd "$prefix" && find . -mindepth 1 | sort | tr '\n' ' ')
[ "$left" = "./keep.txt " ] || fail "uninstall left: $left"
[ -e "$manifest" ] && fail "uninstall left the manifest"

if [ $failures -ne 0 ]; then
  echo "$failures install check(s) failed" >&2
  exit 1
fi
echo "install checks passed"
