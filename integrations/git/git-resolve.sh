# Settling conflicts: resolve and the merge tool of vexel-merge-git, which sources this file.

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
