# The merges that vexel-merge-git makes: the merge driver, the merge tool, and resolve. Functions in round
# brackets run in a process of their own, so that their variables are theirs.

# Sets $options to --rules and --typeInfo as this repository's configuration has them, quoted. Their paths start from
# the top folder. What can't be understood must not count as not set: other rules make another merge.
read_rule_options() {
  options=
  for option in rules typeInfo; do
    status=0
    value=$(git config --type=path --get "vexel.$option") || status=$?
    [ "$status" -ne 1 ] || continue
    if [ "$status" -ne 0 ] || [ -z "$value" ]; then die "vexel.$option in git's configuration must be a path"; fi
    case $value in
      /*) ;;
      *) value=$(pwd)/$value ;;
    esac
    options="$options --$option $(quoted "$value")"
  done
}

# say_messages BASE LEFT RIGHT [OPTIONS...]: $scratch/messages, with the asset's own name for the temporary ones.
say_messages() {
  BASE=$1 LEFT=$2 RIGHT=$3 OPTIONS=$* ASSET=$asset SUFFIX=$record_suffix awk '
    function named(name, as,   at, out) {
      out = ""
      while (name != "" && (at = index($0, name)) > 0) {
        out = out substr($0, 1, at - 1) as
        $0 = substr($0, at + length(name))
      }
      $0 = out $0
    }
    # Of a mistake in the record, whose line is named.
    index(ENVIRON["OPTIONS"], " -i ") && / specified on line [0-9]+$/ {
      sub(/^.*Cannot merge file .*\047: /, ENVIRON["ASSET"] ENVIRON["SUFFIX"] ": ")
    }
    {
      named("\047" ENVIRON["BASE"] "\047", "\047" ENVIRON["ASSET"] "\047")
      named("\047" ENVIRON["LEFT"] "\047", "\047" ENVIRON["ASSET"] "\047 (theirs)")
      named("\047" ENVIRON["RIGHT"] "\047", "\047" ENVIRON["ASSET"] "\047 (ours)")
      print
    }' "$scratch/messages" >&2
}

# merge_into RESULT BASE LEFT RIGHT [-i RECORD]: leaves the record in $scratch/record. Returns the program's status.
merge_into() (
  result=$1 base=$2 left=$3 right=$4
  shift 4
  if [ ! -s "$base" ]; then
    complain "both sides have added $asset, so there is no base to merge it with"
    return 1
  fi
  status=0
  eval "set -- $options \"\$@\""
  "$program" merge -h --force --fallback none -o "$scratch/record" "$@" "$base" "$left" "$right" "$result" \
    2>"$scratch/messages" || status=$?
  say_messages "$base" "$left" "$right" "$@"
  return "$status"
)

# Lists what is pending, a line each, in $scratch/conflicts: path, what left did, what right did.
list_conflicts() ( # BASE LEFT RIGHT [-i RECORD]
  base=$1 left=$2 right=$3
  shift 3
  eval "set -- $options \"\$@\""
  if "$reporter" --conflicts "$@" "$base" "$left" "$right" >"$scratch/conflicts" 2>"$scratch/messages"; then return 0; fi
  say_messages "$base" "$left" "$right" "$@"
  return 1
)

count_conflicts() {
  number=$(wc -l <"$scratch/conflicts")
  if [ "$number" -eq 1 ]; then echo "1 conflict"; else echo "$((number)) conflicts"; fi
}

say_conflicts() {
  ASSET=$asset awk -F '\t' '{printf "CONFLICT %s: %s: left %s, right %s\n", ENVIRON["ASSET"], $1, $2, $3}' \
    "$scratch/conflicts" >&2
}

# is_asset FILE: whether it is in the engine's text format, and not one of its plain .meta files, binary, or a pointer
# to a file elsewhere.
is_asset() { [ "$(head -c 5 "$1" | tr -d '\0')" = %YAML ]; }

are_assets() {
  for version in "$@"; do
    if is_asset "$version"; then return 0; fi
  done
  return 1
}

# Git does what it does without us to files that are none of ours, but bear their names.
merge_as_text() { # OURS BASE THEIRS MARKER_SIZE
  status=0
  git merge-file -q --marker-size="$4" -L ours -L base -L theirs "$1" "$2" "$3" 2>/dev/null || status=$?
  # Git would take a status above 128 for a driver that was killed, and give up.
  [ "$status" -le 127 ] || complain "$asset can't be merged, not even as text"
  [ "$status" -eq 0 ]
}

# Whether git is about to change the work tree and the index: it has locked that. A merge that only looks, such as
# those of git merge-tree or git show --remerge-diff, has no use for a record, and must not touch one that is there.
is_real_merge() {
  [ "$(git rev-parse --is-inside-work-tree)" = true ] && [ -e "$(git_path index.lock)" ]
}

# Called by git with three temporary files in the top folder; the second one takes the result.
merge_driver() {
  is_ancestor=false
  if [ "${1-}" = --ancestor ]; then
    is_ancestor=true
    shift
  fi
  [ $# -eq 5 ] || wrong_usage "merge-driver is called by git"
  base=$1 ours=$2 theirs=$3 marker_size=$4 asset=$5
  # What can't be done with an ancestor is for the merge itself to tell.
  if [ "$is_ancestor" = true ]; then exec 2>/dev/null; fi
  read_rule_options
  keeps_records=false
  if [ "$is_ancestor" = false ] && is_real_merge; then keeps_records=true; fi
  if ! are_assets "$ours" "$theirs" "$base"; then
    [ "$keeps_records" = false ] || remove_record "$asset"
    merge_as_text "$ours" "$base" "$theirs" "$marker_size"
    return
  fi
  make_scratch
  status=0
  merge_into "$scratch/merged" "$base" "$theirs" "$ours" || status=$?
  case $status in
    0) [ "$keeps_records" = false ] || remove_record "$asset" ;;
    2 | 3) [ "$is_ancestor" = true ] || tell_conflicts "$base" "$theirs" "$ours" ;;
    *)
      [ "$keeps_records" = false ] || remove_record "$asset"
      # Ours as the ancestor of both sides would make what theirs did look undone, and drop it.
      if [ "$is_ancestor" = true ]; then
        cat "$base" >"$ours"
      else
        say "$asset is not merged, but left as ours has it; take it so with 'git add', or theirs with 'git checkout --theirs'"
      fi
      return "$status"
      ;;
  esac
  # In one step: git takes what stands there, also after a failure.
  mv -f "$scratch/merged" "$ours"
  return "$status"
}

# tell_conflicts BASE LEFT RIGHT: what the driver says and leaves of them. The merge goes on whatever fails here.
tell_conflicts() {
  list_conflicts "$@" || :
  say_conflicts
  [ "$keeps_records" = true ] || return 0
  if leave_record "$asset" "$(hash_of "$asset" "$scratch/merged")"; then
    say "$(count_conflicts), listed in $asset$record_suffix; to settle: vexel-merge-git resolve $(quoted "$asset")"
  else
    complain "cannot write $asset$record_suffix"
  fi
}

# make_record BASE LEFT RIGHT: where the asset has none (any more), with nothing settled.
make_record() (
  if [ -f "$(record_of "$asset")" ]; then return 0; fi
  status=0
  merge_into "$scratch/merged" "$1" "$2" "$3" || status=$?
  case $status in
    0 | 2 | 3) ;;
    *) return "$status" ;;
  esac
  list_conflicts "$1" "$2" "$3"
  leave_record "$asset" "$(hash_of "$asset" "$scratch/merged")"
)

# choose_side SIDE PATTERN: a resolution for each pending conflict whose path fits the pattern, since a pattern in
# the record itself would also decide about places that only one side has changed.
choose_side() (
  [ -s "$scratch/conflicts" ] || return 0
  SIDE=$1 PATTERN=$2 awk -F '\t' '
    function fits(path, pattern,   p, q, n, i) {
      n = split(path, p, ".")
      if (pattern == "" || path == pattern) return 1
      if (split(pattern, q, ".") != n) return 0
      for (i = 1; i <= n; i++) if (q[i] != "*" && q[i] != p[i]) return 0
      return 1
    }
    fits($1, ENVIRON["PATTERN"]) {print ENVIRON["SIDE"], $1}' "$scratch/conflicts" >"$scratch/chosen"
  [ -s "$scratch/chosen" ] || { complain "no conflict in $asset fits '$2'"; return 1; }
  end_line "$record"
  cat "$scratch/chosen" >>"$record"
)

# refuse_edited RECORD: whether somebody has changed the asset since it was merged, with a word about it.
refuse_edited() {
  if [ "$force" = true ] || [ ! -e "./$asset" ] || [ "$(hash_of "$asset")" = "$(recorded_hash "$1")" ]; then return 1; fi
  if grep -q '^<<<<<<< ' "./$asset"; then
    complain "$asset was merged as text; say --force to merge it anew, and lose what was edited since"
  else
    complain "$asset was edited after the merge; 'git add' it as it is, or say --force to lose the edits"
  fi
}

# settle RESULT BASE LEFT RIGHT: merges once more, with what the user decides now. Returns 0 where nothing is
# pending, and then RESULT holds the merge; 2 where something is; 1 after an error.
settle() (
  result=$1 base=$2 left=$3 right=$4
  record=$(record_of "$asset")
  make_record "$base" "$left" "$right" || return 1
  ! refuse_edited "$record" || return 1
  if [ -n "$side" ]; then
    list_conflicts "$base" "$left" "$right" -i "$record" || return 1
    choose_side "$side" "$conflict_pattern" || return 1
  else
    merged_hash=$(recorded_hash "$record")
    edit "$record" || { complain "the editor failed; nothing is merged"; return 1; }
    # Who looks at the scene in the engine while deciding may save it there.
    end_line "$record"
    [ -n "$(recorded_hash "$record")" ] || echo "# merged: $merged_hash" >>"$record"
    if [ -f "$scratch/stages" ] && ! stages_of "$asset" | cmp -s - "$scratch/stages"; then
      remove_record "$asset"
      complain "$asset is no longer in the conflict that it was in when the editor was opened"
      return 1
    fi
    ! refuse_edited "$record" || return 1
  fi
  status=0
  merge_into "$scratch/merged" "$base" "$left" "$right" -i "$record" || status=$?
  case $status in
    0) replace_file "$result" <"$scratch/merged" ;;
    2 | 3)
      list_conflicts "$base" "$left" "$right" -i "$record" || return 1
      if [ -n "$side" ] && cut -f 1 "$scratch/conflicts" | sed "s/^/$side /" | grep -qxFf "$scratch/chosen"; then
        complain "a key with a blank or a dot can't be named in a record: settle that place in the file itself"
      fi
      return 2
      ;;
    *) return 1 ;;
  esac
)

# end_line FILE: the user's editor may not have.
end_line() {
  if [ -f "$1" ] && lacks_final_newline "$1"; then echo >>"$1"; fi
}

# Also of a name with blanks, while the editor may be a command with arguments.
edit() {
  editor=$(git var GIT_EDITOR) || return 1
  eval "$editor" '"$1"'
}

# Called by git mergetool, which stages the result itself, and restores the file where we fail.
mergetool() {
  [ $# -eq 4 ] || wrong_usage "mergetool is called by git"
  asset=$4 side='' force=false
  make_scratch
  read_rule_options
  cp "./$asset" "$scratch/start" 2>/dev/null || :
  status=0
  settle "$4" "$1" "$3" "$2" || status=$?
  # Git puts the old file back where we fail.
  if [ "$status" -ne 0 ] && [ -f "./$asset" ] && ! cmp -s "./$asset" "$scratch/start"; then
    cp "./$asset" "./$asset.vexel-edited" && say "The edited file is kept as $asset.vexel-edited"
  fi
  case $status in
    0) remove_record "$asset" ;;
    2)
      leave_record "$asset" "$(recorded_hash "$(record_of "$asset")")"
      say "$(count_conflicts) left in $asset"
      ;;
  esac
  return "$status"
}

# unmerged_below PATH...: from the top folder, one a line.
unmerged_below() {
  git ls-files --unmerged --full-name -z -- "$@" | tr '\0' '\n' | cut -f 2- | LC_ALL=C sort -u
}

# named_conflicts PATH: those of ours that somebody means who names a path, from here or, as git prints it, from the top.
named_conflicts() {
  for magic in literal 'top,literal'; do
    named=$(unmerged_below ":($magic)$1" | (go_to_top && ours_among))
    [ -z "$named" ] || break
  done
  [ -z "$named" ] || printf '%s\n' "$named"
}

stages_of() { git ls-files --unmerged -- ":(literal)$1"; }

# write_stages PATH: as files of the work tree, in which line ends are what the user has set.
write_stages() {
  stages_of "$1" >"$scratch/stages"
  rm -f "$scratch/base" "$scratch/left" "$scratch/right"
  while read -r _ blob stage _; do
    case $stage in
      1) version=base ;;
      2) version=right ;;
      *) version=left ;;
    esac
    git cat-file --filters --path="$1" "$blob" >"$scratch/$version" || return 1
  done <"$scratch/stages"
  if [ ! -f "$scratch/left" ] || [ ! -f "$scratch/right" ]; then
    complain "$1 was removed or renamed on one side: 'git add' or 'git rm' it"
    return 1
  fi
  if [ ! -f "$scratch/base" ]; then
    complain "both sides have added $1: take one with 'git checkout --ours' or '--theirs', then 'git add' it"
    return 1
  fi
}

resolve() {
  side='' conflict_pattern='' force=false
  while [ $# -gt 0 ]; do
    case $1 in
      --left | --right | --base)
        [ -z "$side" ] || wrong_usage "only one of --left, --right and --base can be given"
        side=${1#--}
        ;;
      --path)
        [ $# -gt 1 ] || wrong_usage "--path needs a value"
        conflict_pattern=$2
        shift
        ;;
      --path=*) conflict_pattern=${1#*=} ;;
      --force) force=true ;;
      --) shift; break ;;
      -*) wrong_usage "unknown option '$1'" ;;
      *) break ;;
    esac
    shift
  done
  [ $# -gt 0 ] || wrong_usage "resolve needs a file"
  [ -z "$conflict_pattern" ] || [ -n "$side" ] || wrong_usage "--path goes with --left, --right or --base"
  git rev-parse --show-toplevel >/dev/null || exit 128
  make_scratch
  outcome=0
  for file in "$@"; do
    named_conflicts "$file" >"$scratch/found"
    [ -s "$scratch/found" ] || { complain "$file is not in conflict, or has no attribute merge=vexel"; outcome=1; }
    cat "$scratch/found" >>"$scratch/assets"
  done
  go_to_top
  read_rule_options
  LC_ALL=C sort -u "$scratch/assets" >"$scratch/sorted"
  # Not on standard input, which is the editor's.
  while IFS= read -r asset <&3; do
    resolve_asset || outcome=1
  done 3<"$scratch/sorted"
  sweep
  return "$outcome"
}

# Resolves $asset, and stages it if nothing is left.
resolve_asset() {
  write_stages "$asset" || return 1
  if ! are_assets "$scratch/base" "$scratch/left" "$scratch/right"; then
    complain "$asset was merged as text: edit it, and 'git add' it"
    return 1
  fi
  status=0
  settle "./$asset" "$scratch/base" "$scratch/left" "$scratch/right" || status=$?
  case $status in
    0)
      stage "$asset" || return 1
      remove_record "$asset"
      printf 'Resolved %s\n' "$asset"
      ;;
    2)
      # What is settled already counts when the rest is settled in the engine.
      replace_file "./$asset" <"$scratch/merged"
      leave_record "$asset" "$(hash_of "$asset")" || complain "cannot write $asset$record_suffix"
      say "$(count_conflicts) left in $asset:"
      say_conflicts
      return 1
      ;;
    *) return 1 ;;
  esac
}

# stage PATH: adds it, and gives it the line ends that the user has set for files of the work tree.
stage() {
  git add -- ":(literal)$1" || return 1
  git cat-file --filters ":0:$1" >"$scratch/checked-out" || return 1
  if cmp -s "$scratch/checked-out" "./$1"; then return 0; fi
  replace_file "./$1" <"$scratch/checked-out"
  git add -- ":(literal)$1"
}
