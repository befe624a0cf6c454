# enable, disable and status of vexel-merge-git, which sources this file.
# What was there before is kept in files of its own, so that disable can restore it, and only it: what was changed
# by hand since then stays.

default_patterns='*.vexel *.prefab *.meta'

parse_setup_options() {
  scope=local
  patterns=
  patterns_given=false
  while [ $# -gt 0 ]; do
    case $1 in
      --global) scope=global ;;
      --patterns)
        [ $# -gt 1 ] || wrong_usage "--patterns needs a value"
        patterns=$2 patterns_given=true
        shift
        ;;
      --patterns=*) patterns=${1#*=} patterns_given=true ;;
      *) wrong_usage "unknown argument '$1'" ;;
    esac
    shift
  done
  if [ "$patterns_given" = true ] && [ -z "$(attribute_lines "$patterns")" ]; then die "--patterns is empty"; fi
  case $patterns in
    *,*) die "patterns stand with blanks between them, not commas" ;;
  esac
  use_scope
}

# use_scope: where the set-up of $scope is, and what is remembered of before.
use_scope() {
  if [ "$scope" = global ]; then
    [ -n "${HOME-}" ] || die "HOME is not set"
    user_folder=${XDG_CONFIG_HOME:-$HOME/.config}/git
    state=$user_folder/vexel-merge
    attributes=$(recall attributes.path) || attributes=$(user_attributes)
    config=${GIT_CONFIG_GLOBAL:-$HOME/.gitconfig}
    if [ ! -e "$config" ] && [ -e "$user_folder/config" ]; then config=$user_folder/config; fi
  else
    go_to_top
    state=$(common_path vexel-merge)
    attributes=.gitattributes
    config=$(common_path config)
  fi
}

# Without a home there is none.
user_attributes() {
  [ -n "${HOME-}" ] || return 0
  git config --global --includes --type=path --get core.attributesFile ||
    echo "${XDG_CONFIG_HOME:-$HOME/.config}/git/attributes"
}

# What git's configuration gets, a key and its value a line. In a driver, git replaces what follows a percent sign.
# hideResolved would hand the merge tool files that git has half merged already, as text. Without the function, git
# could show no difference at all once the program is gone.
wanted_configuration() {
  call=$(command_for_git)
  driver=$(printf '%s\n' "$call" | sed 's/%/%%/g')
  cat <<TEXT
merge.vexel.name structural merge of scenes and prefabs
merge.vexel.driver $driver merge-driver %O %A %B %L %P
merge.vexel.recursive vexel-ancestor
merge.vexel-ancestor.name structural merge of common ancestors
merge.vexel-ancestor.driver $driver merge-driver --ancestor %O %A %B %L %P
diff.vexel.textconv f() { $call textconv "\$1" 2>/dev/null || cat -- "\$1"; }; f
diff.vexel.xfuncname ^--- (.*)\$
mergetool.vexel.cmd $call mergetool "\$BASE" "\$LOCAL" "\$REMOTE" "\$MERGED"
mergetool.vexel.trustExitCode true
mergetool.vexel.hideResolved false
TEXT
}

# for_wanted_keys COMMAND: calls it with each key and its value, in this process.
for_wanted_keys() {
  while read -r key value; do "$1" "$key" "$value"; done <<TEXT
$(wanted_configuration)
TEXT
}

check_key() {
  [ "$(git config --"$scope" --get-all "$1" | wc -l)" -le 1 ] || die "$1 has several values; leave one at most"
}

set_key() {
  current=$(git config --"$scope" --get "$1") && is_set=true || is_set=false
  if [ "$is_set" = true ] && [ "$current" = "$2" ]; then return 0; fi
  added=$(recall "key.$1.added") || added=
  # A value that is neither ours nor the wanted one is somebody's own.
  if [ "$is_set" = true ] && [ "$current" != "$added" ]; then remember "key.$1.previous" "$current"; fi
  remember "key.$1.added" "$2"
  git config --"$scope" "$1" "$2"
  changed=true
}

restore_key() {
  current=$(git config --"$scope" --get "$1") || return 0
  [ "$current" = "$(recall "key.$1.added")" ] || return 0
  if previous=$(recall "key.$1.previous"); then
    git config --"$scope" "$1" "$previous"
  else
    git config --"$scope" --unset "$1"
  fi
}

has_set_keys() { [ -f "$state" ] && git config -f "$state" --get-regexp '^key\..*\.added$' >/dev/null; }

# Comments, order and blanks are only in a copy of the whole file. It is good as long as the file stays as enable left
# it; after that, one key after the other is restored.
keep_configuration() {
  if ! has_set_keys; then
    if [ -f "$config" ]; then cp "$config" "$state.before"; else remember config.absent true; fi
  elif ! cmp -s "$config" "$state.after"; then
    rm -f "$state.before" "$state.after"
  fi
}

restore_configuration() {
  if [ -f "$state.before" ] && cmp -s "$config" "$state.after"; then
    replace_file "$config" <"$state.before"
    return 0
  fi
  keys=$(git config -f "$state" --name-only --get-regexp '^key\..*\.added$' | sed 's/^key\.//; s/\.added$//') || keys=
  for key in $keys; do restore_key "$key"; done
  if recall config.absent >/dev/null && [ -f "$config" ] && [ ! -s "$config" ]; then rm -f "$config"; fi
}

where() { if [ "$scope" = global ]; then echo "all your repositories"; else echo "this repository"; fi; }

attribute_lines() {
  set -f
  for pattern in $1; do printf '%s merge=vexel diff=vexel\n' "$pattern"; done
  set +f
}

# given_patterns FILE: those that the file gives to us, in one line.
given_patterns() {
  awk '!/^#/ && /[ \t]merge=vexel([ \t]|\r?$)/ {printf "%s%s", sep, $1; sep = " "}' "$1"
}

enable() {
  parse_setup_options "$@"
  changed=false
  [ -x "$program" ] || die "VexelYAMLMerge is not beside vexel-merge-git, in $here"
  if [ "$scope" = local ]; then is_plain "$attributes" || die "git follows no symbolic link or folder at $attributes"; fi
  for_wanted_keys check_key
  block_part "$attributes" inside >/dev/null
  mkdir -p "${state%/*}"
  keep_configuration
  for_wanted_keys set_key
  [ ! -f "$state.before" ] || cp "$config" "$state.after"
  # A block that is there already may be a colleague's, or edited: it counts unless others are asked for.
  if [ "$patterns_given" = true ] || ! has_block "$attributes"; then
    set_block "$attributes" attributes "$(attribute_lines "${patterns:-$default_patterns}")"
  fi
  if [ "$scope" = global ]; then remember attributes.path "$attributes"; else exclude_records; fi
  patterns=$(given_patterns "$attributes")
  if [ "$changed" = false ]; then
    tell "Nothing to change: $patterns are merged structurally in $(where)."
  else
    tell "From now on, $patterns are merged structurally in $(where)."
    if [ "$scope" = local ] && [ -n "$(git status --porcelain -- .gitattributes)" ]; then
      echo ".gitattributes has changed: commit it, and only 'vexel-merge-git enable' is left to your colleagues."
    fi
  fi
  for_wanted_keys check_effect
}

# A file that the configuration includes may have the last word.
check_effect() {
  if [ "$scope" = local ] && [ "$(git config --get "$1")" != "$2" ]; then
    die "another setting of $1 counts here: git config --show-origin --get-all $1"
  fi
}

disable() {
  parse_setup_options "$@"
  [ "$patterns_given" = false ] || wrong_usage "--patterns is only for enable"
  if [ "$scope" = local ]; then
    sweep
    if has_records; then die "conflicts are left: settle them or abort the merge first"; fi
  fi
  if [ ! -f "$state" ]; then
    echo "Nothing to undo in $(where)."
    return 0
  fi
  if [ "$scope" = global ]; then
    restore_block "$attributes" attributes
  else
    # A symbolic link that has taken the file's place since then leads to somebody else's file.
    if is_plain "$attributes"; then restore_block "$attributes" attributes; fi
    exclude=$(exclude_file)
    [ -z "$exclude" ] || restore_block "$exclude" exclude
  fi
  restore_configuration
  rm -f "$state" "$state.before" "$state.after" "$state.attributes" "$state.exclude"
  echo "Undone in $(where)."
  case $(git config --get merge.vexel.driver) in
    *vexel-merge-git*) echo "It is still set for all your repositories: see 'vexel-merge-git disable --global'." ;;
  esac
}

# setting KEY: for whom it is set. False where git would not get at us.
setting() {
  value=$(git config --get "$1") || { echo "not set"; return 1; }
  case $value in
    *vexel-merge-git*) ;;
    *) printf 'set to something else: %s\n' "$value"; return 1 ;;
  esac
  # As git starts it: with another PATH, or after a move, the command may be gone.
  call=$(printf '%s\n' "$value" | sed -e 's/^f() { //' -e 's/ textconv .*//' -e 's/ mergetool .*//' \
    -e '/ merge-driver /s/%%/%/g' -e 's/ merge-driver .*//')
  sh -c "$call --version" >/dev/null 2>&1 || { echo "set, but there is no command $call"; return 1; }
  case $(git config --show-scope --get "$1" | cut -f 1) in
    local | worktree) echo "set for this repository" ;;
    *) echo "set for all your repositories" ;;
  esac
}

# attribute_sources: the patterns that are given to us, and the files that say so. False where another line takes
# a kind of file away again.
attribute_sources() {
  found=false
  for file in .gitattributes "$(user_attributes)" "$(git_path info/attributes)"; do
    [ -f "$file" ] || continue
    given=$(given_patterns "$file")
    [ -n "$given" ] || continue
    found=true
    printf '%s (%s)\n' "$given" "$file"
    set -f
    for pattern in $given; do
      case $pattern in
        # Of these there is a file whose name tells.
        */*) ;;
        '*'.*)
          [ -n "$(line_of "x${pattern#?}" | ours_among)" ] && continue
          printf '  but not %s: another line takes it away\n' "$pattern"
          found=false
          ;;
      esac
    done
    set +f
  done
  [ "$found" = true ]
}

status() {
  [ $# -eq 0 ] || wrong_usage "unknown argument '$1'"
  go_to_top
  complete=true
  if version=$("$reporter" --version 2>/dev/null) && [ -x "$program" ]; then
    tell "program        VexelYAMLMerge ${version##* } ($program)"
  else
    tell "program        not found in $here"
    complete=false
  fi
  text=$(setting merge.vexel.driver) || complete=false
  tell "merge driver   $text"
  text=$(setting diff.vexel.textconv) || complete=false
  tell "diff driver    $text"
  text=$(setting mergetool.vexel.cmd) || complete=false
  tell "merge tool     $text"
  text=$(attribute_sources) || complete=false
  printf 'attributes     %s\n' "${text:-no pattern with merge=vexel}" | tell_lines
  for option in rules typeInfo; do
    value=$(git config --type=path --get "vexel.$option") || continue
    tell "$(printf '%-14s %s' "$option" "$value")"
    [ -f "$value" ] || { echo "  but that file is missing"; complete=false; }
  done
  # Where somebody's own hook has kept ours away, records may have outlived their conflicts.
  sweep
  unmerged_paths | ours_among | while IFS= read -r line; do
    path_of "$line"
    find_record "$path"
    tell "in conflict    $path"
    [ "$record" != "$kept" ] || tell "  its record is $record"
  done
  [ "$complete" = true ]
}
