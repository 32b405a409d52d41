# bash completion for pinforge: switches, -lang values, and template names for -template
# (the names pinforge itself finds: PINFORGE_TEMPLATE_PATH folders, then the template library
# installed next to the program), besides plain file names.
# Installed as <prefix>/share/bash-completion/completions/pinforge.

# The folder this file was installed in: <prefix>/share/bash-completion/completions.
_pinforge_completion_dir=$(cd "$(dirname "${BASH_SOURCE[0]}")" 2>/dev/null && pwd)

# Prints the folders searched for templates, one per line, in pinforge's own order.
_pinforge_template_dirs() {
  local program=$1 dir
  local IFS=:
  for dir in $PINFORGE_TEMPLATE_PATH; do
    [ -n "$dir" ] && printf '%s\n' "$dir"
  done
  # The library installed next to the program being completed ...
  if [[ $program != */* ]]; then
    program=$(type -P -- "$program" 2>/dev/null)
  fi
  if [ -n "$program" ]; then
    program=$(readlink -f -- "$program" 2>/dev/null || printf '%s' "$program")
    printf '%s\n' "${program%/*}/../share/pinforge/templates"
  fi
  # ... and the one installed with this completion file.
  if [ -n "$_pinforge_completion_dir" ]; then
    printf '%s\n' "$_pinforge_completion_dir/../../pinforge/templates"
  fi
}

# Prints the template names (without .tmpl or .tcl) of every template folder, once each.
_pinforge_template_names() {
  local dir file name
  local -A seen=()
  while IFS= read -r dir; do
    [ -d "$dir" ] || continue
    for file in "$dir"/*; do
      [ -f "$file" ] || continue
      name=${file##*/}
      name=${name%.tmpl}
      name=${name%.tcl}
      if [ -z "${seen[$name]+set}" ]; then
        seen[$name]=1
        printf '%s\n' "$name"
      fi
    done
  done < <(_pinforge_template_dirs "$1")
}

_pinforge() {
  local current=${COMP_WORDS[COMP_CWORD]}
  local previous=${COMP_WORDS[COMP_CWORD-1]}
  local switches="-lib -lang -module -prj -template -o -err -deleteonerror --nodelist --a --inc
    -g -D -I --list --help --version -h -help -?"
  COMPREPLY=()
  case $previous in
    -lang | --lang)
      mapfile -t COMPREPLY < <(compgen -W "vhdl verilog systemverilog sv" -- "$current")
      return 0
      ;;
    -template | --template)
      mapfile -t COMPREPLY < <(compgen -W "$(_pinforge_template_names "${COMP_WORDS[0]}")" \
        -- "$current"; compgen -f -- "$current")
      return 0
      ;;
    -o | --o | -err | --err)
      mapfile -t COMPREPLY < <(compgen -f -- "$current")
      return 0
      ;;
    -I | --I)
      mapfile -t COMPREPLY < <(compgen -d -- "$current")
      return 0
      ;;
    -module | --module | -prj | --prj | -g | --g | -D | --D)
      return 0
      ;;
  esac
  if [[ $current == -* ]]; then
    mapfile -t COMPREPLY < <(compgen -W "$switches" -- "$current")
  else
    # Design files after -lib, a response file after @, anything else as a file.
    mapfile -t COMPREPLY < <(compgen -f -- "$current")
  fi
  return 0
}

complete -o filenames -F _pinforge pinforge
