# enable, disable and status of vexel-merge-git, which sources this file.
# What was there before is kept in a file of its own, in git's configuration format, so that disable can
# restore it, and only it: what was changed by hand since then stays.

default_patterns='*.vexel *.prefab *.meta'
block_begin='# vexel-merge-git begin ("vexel-merge-git disable" removes this)'
block_end='# vexel-merge-git end'

parse_setup_options() {
  scope=local
  patterns=
  while [ $# -gt 0 ]; do
    case $1 in
      --global) scope=global ;;
      --patterns)
        [ $# -gt 1 ] || wrong_usage "--patterns needs a value"
        patterns=$2
        [ -n "$patterns" ] || die "--patterns is empty"
        shift
        ;;
      --patterns=*) patterns=${1#*=} ;;
      *) wrong_usage "unknown argument '$1'" ;;
    esac
    shift
  done
  if [ "$scope" = global ]; then
    user_folder=${XDG_CONFIG_HOME:-$HOME/.config}/git
    state=$user_folder/vexel-merge
    attributes=$(git config --global --type=path --get core.attributesFile) || attributes=$user_folder/attributes
  else
    go_to_top
    state=$(git rev-parse --git-common-dir)/vexel-merge
    attributes=.gitattributes
  fi
}

# What git's configuration gets, a key and its value a line.
# hideResolved would hand the merge tool files that git has half merged already, as text.
wanted_configuration() {
  call=$(command_for_git)
  cat <<TEXT
merge.vexel.name structural merge of scenes and prefabs
merge.vexel.driver $call merge-driver %O %A %B %P
merge.vexel.recursive vexel-ancestor
merge.vexel-ancestor.name structural merge of common ancestors
merge.vexel-ancestor.driver $call merge-driver --ancestor %O %A %B %P
diff.vexel.textconv $call textconv
diff.vexel.xfuncname ^--- (.*)\$
mergetool.vexel.cmd $call mergetool "\$BASE" "\$LOCAL" "\$REMOTE" "\$MERGED"
mergetool.vexel.trustExitCode true
mergetool.vexel.hideResolved false
TEXT
}

recall() { git config -f "$state" --get "$1"; }
remember() { git config -f "$state" "$1" "$2"; }

# set_key KEY VALUE
set_key() {
  values=$(git config --"$scope" --get-all "$1") || values=
  current=$(git config --"$scope" --get "$1") || current=
  [ "$values" = "$current" ] || die "$1 has several values; leave one at most"
  [ "$current" != "$2" ] || return 0
  added=$(recall "key.$1.added") || added=
  # A value that is neither ours nor the wanted one is somebody's own.
  if [ -n "$current" ] && [ "$current" != "$added" ]; then remember "key.$1.previous" "$current"; fi
  remember "key.$1.added" "$2"
  git config --"$scope" "$1" "$2"
  changed=true
}

# restore_key KEY
restore_key() {
  current=$(git config --"$scope" --get "$1") || current=
  [ "$current" = "$(recall "key.$1.added")" ] || return 0
  if previous=$(recall "key.$1.previous"); then
    git config --"$scope" "$1" "$previous"
  else
    git config --"$scope" --unset "$1"
  fi
}

block_of() { [ ! -f "$1" ] || awk -v b="$block_begin" -v e="$block_end" '$0 == e {p = 0} p; $0 == b {p = 1}' "$1"; }
has_block() { [ -f "$1" ] && grep -qxF "$block_begin" "$1"; }
text_without_block() {
  awk -v b="$block_begin" -v e="$block_end" '$0 == b {skip = 1} !skip; $0 == e {skip = 0}' "$1"
}

# set_block FILE NAME LINES: the lines between our marks, at the end unless the marks are there already.
set_block() {
  [ "$(block_of "$1")" != "$3" ] || return 0
  changed=true
  if has_block "$1"; then
    if ! recall "file.$2.before" >/dev/null; then
      remember "file.$2.before" marked
      remember "file.$2.block" "$(block_of "$1")"
    fi
    write_block "$1" "$3"
    return 0
  fi
  before=there
  [ -f "$1" ] || before=absent
  if [ -f "$1" ] && lacks_final_newline "$1"; then before=open; fi
  remember "file.$2.before" "$before"
  mkdir -p "$(dirname "$1")"
  {
    [ ! -f "$1" ] || cat "$1"
    [ "$before" != open ] || echo
    printf '%s\n%s\n%s\n' "$block_begin" "$3" "$block_end"
  } | replace_file "$1"
}

# write_block FILE LINES: other lines where our block stands.
write_block() {
  LINES_OF_BLOCK=$2 awk -v b="$block_begin" -v e="$block_end" '
    $0 == e {skip = 0}
    !skip
    $0 == b {skip = 1; print ENVIRON["LINES_OF_BLOCK"]}' "$1" | replace_file "$1"
}

# restore_block FILE NAME
restore_block() {
  before=$(recall "file.$2.before") || return 0
  has_block "$1" || return 0
  if [ "$before" = marked ]; then
    write_block "$1" "$(recall "file.$2.block")"
    return 0
  fi
  # The line break in front of our block was ours, too, unless something follows now.
  if lacks_final_newline "$1" || { [ "$before" = open ] && [ "$(sed -n '$p' "$1")" = "$block_end" ]; }; then
    text_without_block "$1" | awk 'NR > 1 {print ""} {printf "%s", $0}' | replace_file "$1"
  else
    text_without_block "$1" | replace_file "$1"
  fi
  if [ "$before" = absent ] && [ ! -s "$1" ]; then rm -f "$1"; fi
}

where() { if [ "$scope" = global ]; then echo "all your repositories"; else echo "this repository"; fi; }

attribute_lines() {
  set -f
  for pattern in $1; do printf '%s merge=vexel diff=vexel\n' "$pattern"; done
  set +f
}

patterns_of() { block_of "$1" | sed 's/ .*//' | tr '\n' ' ' | sed 's/ $//'; }

enable() {
  parse_setup_options "$@"
  changed=false
  [ -x "$program" ] || die "VexelYAMLMerge is not beside vexel-merge-git, in $here"
  mkdir -p "$(dirname "$state")"
  # The lines that are there already, a colleague's perhaps, count unless others are asked for.
  [ -n "$patterns" ] || patterns=$(patterns_of "$attributes")
  [ -n "$patterns" ] || patterns=$default_patterns
  set_wanted_keys
  set_block "$attributes" attributes "$(attribute_lines "$patterns")"
  [ "$scope" = global ] || set_block "$(git_path info/exclude)" exclude '*.vexel-conflicts'
  if [ "$changed" = false ]; then
    echo "Nothing to change: $patterns are merged structurally in $(where)."
    return 0
  fi
  echo "From now on, $patterns are merged structurally in $(where)."
  if [ "$scope" = local ] && [ -n "$(git status --porcelain -- .gitattributes)" ]; then
    echo ".gitattributes has changed: commit it, and only 'vexel-merge-git enable' is left to your colleagues."
  fi
}

set_wanted_keys() {
  # Not in a pipe, which would run in a process of its own.
  while read -r key value; do set_key "$key" "$value"; done <<TEXT
$(wanted_configuration)
TEXT
}

disable() {
  parse_setup_options "$@"
  [ -z "$patterns" ] || wrong_usage "--patterns is only for enable"
  if [ ! -f "$state" ]; then
    echo "Nothing to undo in $(where)."
    return 0
  fi
  keys=$(git config -f "$state" --name-only --get-regexp '^key\..*\.added$' | sed 's/^key\.//; s/\.added$//') || keys=
  for key in $keys; do restore_key "$key"; done
  restore_block "$attributes" attributes
  [ "$scope" = global ] || restore_block "$(git_path info/exclude)" exclude
  rm -f "$state"
  echo "Undone in $(where): git merges as it did before."
}

# setting KEY: for whom it is set. False where git would not get at us.
setting() {
  value=$(git config --get "$1") || { echo "not set"; return 1; }
  case $value in
    *vexel-merge-git*) ;;
    *) echo "set to something else: $value"; return 1 ;;
  esac
  # As git starts it: with another PATH, or after a move, the command may be gone.
  call=$(printf '%s\n' "$value" | sed -e 's/ merge-driver .*//' -e 's/ textconv$//' -e 's/ mergetool .*//')
  sh -c "$call --version" >/dev/null 2>&1 || { echo "set, but there is no command $call"; return 1; }
  case $(git config --show-scope --get "$1" | cut -f 1) in
    local | worktree) echo "set for this repository" ;;
    *) echo "set for all your repositories" ;;
  esac
}

# attribute_sources: the patterns that are given to us, and the files that say so.
attribute_sources() {
  user_attributes=$(git config --type=path --get core.attributesFile) ||
    user_attributes=${XDG_CONFIG_HOME:-$HOME/.config}/git/attributes
  for file in .gitattributes "$user_attributes" "$(git_path info/attributes)"; do
    [ -f "$file" ] || continue
    given=$(awk '!/^#/ && /[ \t]merge=vexel([ \t]|\r?$)/ {printf "%s%s", sep, $1; sep = " "}' "$file")
    [ -z "$given" ] || printf '%s (%s)\n' "$given" "$file"
  done
}

status() {
  [ $# -eq 0 ] || wrong_usage "unknown argument '$1'"
  go_to_top
  complete=true
  if version=$("$reporter" --version 2>/dev/null) && [ -x "$program" ]; then
    echo "program        VexelYAMLMerge ${version##* } ($program)"
  else
    echo "program        not found in $here"
    complete=false
  fi
  text=$(setting merge.vexel.driver) || complete=false
  echo "merge driver   $text"
  text=$(setting diff.vexel.textconv) || complete=false
  echo "diff driver    $text"
  text=$(setting mergetool.vexel.cmd) || complete=false
  echo "merge tool     $text"
  sources=$(attribute_sources)
  [ -n "$sources" ] || complete=false
  echo "attributes     ${sources:-no pattern with merge=vexel}"
  # Where somebody's own hook has kept ours away, records may have outlived their conflicts.
  sweep
  if [ -f "$(record_list)" ]; then sed 's/^/in conflict    /' "$(record_list)"; fi
  [ "$complete" = true ]
}
