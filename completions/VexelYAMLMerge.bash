# Completes VexelYAMLMerge and the vexel-merge programs in bash 4 and later. It needs nothing else: without
# the bash-completion package, source this file in ~/.bashrc.

# _vexel_offer CANDIDATE...: those that begin with what has been typed.
_vexel_offer() {
  local candidate
  for candidate in "$@"; do
    [[ "$candidate" != "$cur"* ]] || COMPREPLY+=("$candidate")
  done
}

# _vexel_offer_quoted CANDIDATE...: the same for what strangers have named, which must not become a command.
_vexel_offer_quoted() {
  local candidate
  for candidate in "$@"; do
    [[ "$candidate" != "$cur"* ]] || COMPREPLY+=("$(printf '%q' "$candidate")")
  done
}

# _vexel_files [EXTENSION...]: files with one of the extensions, or any, and folders.
_vexel_files() {
  local file extension
  compopt -o filenames
  while IFS= read -r file; do
    extension="${file##*.}"
    [[ $# -gt 0 && " $* " != *" $extension "* && ! -d "${file/#\~\//$HOME/}" ]] || COMPREPLY+=("$file")
  done < <(compgen -f -- "$cur")
}

# Sets cur to the word at the cursor as it will be without quotes, prev to the one before it.
_vexel_words() {
  cur="${COMP_WORDS[COMP_CWORD]}"
  prev="${COMP_WORDS[COMP_CWORD - 1]}"
  cur="${cur#[\"\']}"
  cur="${cur//\\/}"
  COMPREPLY=()
}

# _vexel_paths_started FIRST OPTIONS_WITH_VALUE: whether a word from index FIRST on, before the cursor, is a path.
# Behind it the programs take no option.
_vexel_paths_started() {
  local i
  for ((i = $1; i < COMP_CWORD; i++)); do
    case "${COMP_WORDS[i]}" in
      -*) [[ "$2" != *" ${COMP_WORDS[i]} "* ]] || ((i++)) ;;
      *) return 0 ;;
    esac
  done
  return 1
}

# _vexel_option_value: completes the value of the option before the cursor, false where it takes none.
_vexel_option_value() {
  case "$prev" in
    -i | -o | --assets) _vexel_files ;;
    --rules) _vexel_files txt ;;
    --typeInfo) _vexel_files yaml vexel ;;
    --fallback)
      _vexel_offer none auto
      _vexel_files txt
      ;;
    *) return 1 ;;
  esac
}

_vexel_yaml_merge() {
  local cur prev options=()
  _vexel_words
  if [[ "$COMP_CWORD" -eq 1 ]]; then
    _vexel_offer merge diff strip unittest
    return
  fi
  case "${COMP_WORDS[1]}" in
    merge)
      options=(-l -r -p -i -o -h --rules --typeInfo --fallback --force --describe --timing --nothreads
        --safe)
      ;;
    diff | strip) options=(--rules --typeInfo -h --timing --nothreads) ;;
  esac
  if ! _vexel_paths_started 2 " -i -o --rules --typeInfo --fallback "; then
    if [[ " ${options[*]} " == *" $prev "* ]] && _vexel_option_value; then return; fi
    if [[ "$cur" == -* ]]; then
      _vexel_offer "${options[@]}"
      return
    fi
  fi
  if [[ " ${COMP_WORDS[*]} " == *" --force "* ]]; then
    _vexel_files
  else
    _vexel_files vexel prefab meta
  fi
}

_vexel_merge_report() {
  local cur prev
  _vexel_words
  if ! _vexel_paths_started 1 " -o --title --theirs --ours -i --assets --rules --typeInfo --committed "; then
    case "$prev" in
      --title | --theirs | --ours) return ;;
      --committed) _vexel_files vexel prefab meta && return ;;
      -o) _vexel_files html && return ;;
      *) if _vexel_option_value; then return; fi ;;
    esac
    if [[ "$cur" == -* ]]; then
      _vexel_offer -o --title --theirs --ours -i --assets --rules --typeInfo --committed --safe --summary --json \
        --conflicts --text --version --help
      return
    fi
  fi
  _vexel_files vexel prefab meta
}

_vexel_merge_view() {
  local cur prev
  _vexel_words
  if ! _vexel_paths_started 1 " -i -o --rules --typeInfo --title --theirs --ours --base --port --idle-timeout "; then
    case "$prev" in
      --title | --theirs | --ours | --base | --port | --idle-timeout) return ;;
      -o) _vexel_files && return ;;
      *) if _vexel_option_value; then return; fi ;;
    esac
    if [[ "$cur" == -* ]]; then
      _vexel_offer -i -o --plain --rules --typeInfo --title --theirs --ours --base --port --no-browser \
        --idle-timeout --version --help
      return
    fi
  fi
  _vexel_files vexel prefab meta
}

_vexel_revisions() {
  local items
  mapfile -t items < <(git for-each-ref --format='%(refname:short)' refs/heads refs/tags refs/remotes 2>/dev/null)
  _vexel_offer_quoted HEAD "${items[@]}"
}

# The files that resolve is for, as they are called from the current folder.
_vexel_unmerged() { git ls-files --unmerged -z :/ 2>/dev/null | tr '\0' '\n' | cut -f 2- | sort -u; }

_vexel_merge_git() {
  local cur prev word items=()
  _vexel_words
  if [[ "$COMP_CWORD" -eq 1 ]]; then
    _vexel_offer enable disable status resolve check preview report review --version --help
    return
  fi
  case "${COMP_WORDS[1]} $prev" in
    "enable --patterns")
      # As if it were a file, so that blanks and stars are quoted.
      compopt -o filenames
      _vexel_offer "*.vexel *.prefab *.meta"
      ;;
    "enable "*) _vexel_offer --global --patterns ;;
    "disable "*) _vexel_offer --global ;;
    "resolve --path")
      # The conflicts that the records name.
      while IFS= read -r word; do
        [[ ! -f "$word.vexel-conflicts" ]] ||
          mapfile -t -O "${#items[@]}" items < <(sed -n 's/^Left  \([^ ]*\).*/\1/p' "$word.vexel-conflicts")
      done < <(_vexel_unmerged)
      _vexel_offer_quoted "${items[@]}"
      ;;
    "resolve "*)
      if [[ "$cur" == -* && " ${COMP_WORDS[*]:0:COMP_CWORD} " != *" -- "* ]]; then
        _vexel_offer -p --web --port --no-browser --theirs --left --ours --right --base --path --color= --as-is --force --
      else
        compopt -o filenames
        mapfile -t items < <(_vexel_unmerged)
        _vexel_offer "${items[@]}"
      fi
      ;;
    "report -o") _vexel_files html ;;
    "report "*)
      if [[ " ${COMP_WORDS[*]:0:COMP_CWORD} " == *" -- "* ]]; then
        _vexel_files vexel prefab meta
      elif [[ "$cur" == -* ]]; then
        _vexel_offer -o --
      else
        _vexel_revisions
      fi
      ;;
    "review --port") ;;
    "review "*)
      if [[ " ${COMP_WORDS[*]:0:COMP_CWORD} " == *" -- "* ]]; then
        _vexel_files vexel prefab meta
      elif [[ "$cur" == -* ]]; then
        _vexel_offer --port --no-browser --
      else
        _vexel_revisions
      fi
      ;;
    "check "*)
      case "$cur" in
        -*) _vexel_offer --staged --conflicts -- ;;
        *) _vexel_revisions ;;
      esac
      ;;
    "preview "*) _vexel_revisions ;;
  esac
}

complete -F _vexel_yaml_merge VexelYAMLMerge
complete -F _vexel_merge_git vexel-merge-git
complete -F _vexel_merge_report vexel-merge-report
complete -F _vexel_merge_view vexel-merge-view
