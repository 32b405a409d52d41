# bash completion for pinforge: switches, -lang values, and template names for -template
# (the names pinforge itself finds, in its own search order), besides plain file names.
# Installed as <prefix>/share/bash-completion/completions/pinforge.

# The folder this file was installed in: <prefix>/share/bash-completion/completions.
_pinforge_completion_dir=$(cd "$(dirname "${BASH_SOURCE[0]}")" 2>/dev/null && pwd)

# Prints the template names the program being completed finds, one per line. The program's own
# `--help` lists them in its search order (PINFORGE_TEMPLATE_PATH, the library installed beside
# it, and the source tree's templates/ when it runs from its build folder), so no second copy of
# that order is kept here. When the program cannot be run, the PINFORGE_TEMPLATE_PATH folders
# and the library installed with this file are read instead.
_pinforge_template_names() {
  local program=$1
  if [[ $program != */* ]]; then
    program=$(type -P -- "$program" 2>/dev/null)
  fi
  if [ -n "$program" ] && [ -x "$program" ]; then
    local help
    if help=$("$program" --help 2>/dev/null); then
      printf '%s\n' "$help" | sed -n '/^Templates:$/,$ { /^  [^ (]/ s/^  //p; }'
      return 0
    fi
  fi
  local dir file name
  local -A seen=()
  local folders=$PINFORGE_TEMPLATE_PATH
  [ -n "$_pinforge_completion_dir" ] && folders+=:$_pinforge_completion_dir/../../pinforge/templates
  local IFS=:
  for dir in $folders; do
    [ -n "$dir" ] && [ -d "$dir" ] || continue
    for file in "$dir"/*; do
      [ -f "$file" ] || continue
      name=${file##*/}
      [[ $name == .* ]] && continue
      name=${name%.tmpl}
      name=${name%.tcl}
      if [ -z "${seen[$name]+set}" ]; then
        seen[$name]=1
        printf '%s\n' "$name"
      fi
    done
  done
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
