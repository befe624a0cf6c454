# Settling conflicts: resolve and the merge tool of vexel-merge-git, which sources this file.

# make_record BASE LEFT RIGHT: where the asset has none (any more), with nothing settled. Sets $record.
make_record() {
  find_record "$asset"
  [ -z "$record" ] || return 0
  status=0
  merge_into "$scratch/merged" "$1" "$2" "$3" || status=$?
  case $status in
    0 | 2 | 3) ;;
    *) return "$status" ;;
  esac
  list_conflicts "$1" "$2" "$3" || return 1
  leave_record "$asset" "$(hash_of "$asset" "$scratch/merged")"
}

# choose_side SIDE PATTERN: adds to $scratch/decided a resolution for each pending conflict whose path fits the pattern,
# since a pattern in the record itself would also decide about places that only one side has changed. Paths are texts:
# as numbers, two file IDs of 19 digits may be equal.
choose_side() (
  [ -s "$scratch/conflicts" ] || return 0
  SIDE=$1 PATTERN=$2 awk -F '\t' '
    function fits(path, pattern,   p, q, n, i) {
      n = split(path, p, ".")
      if (pattern == "") return 1
      if (split(pattern, q, ".") != n) return 0
      for (i = 1; i <= n; i++) if (q[i] != "*" && q[i] "" != p[i] "") return 0
      return 1
    }
    fits($1, ENVIRON["PATTERN"]) {print ENVIRON["SIDE"], $1}' "$scratch/conflicts" >"$scratch/chosen"
  [ -s "$scratch/chosen" ] || { complain "no conflict in $asset fits '$2'"; return 1; }
  cat "$scratch/chosen" >>"$scratch/decided"
)

# refuse_edited: whether somebody has changed the asset since it was merged, with a word about it.
refuse_edited() {
  if [ "$force" = true ] || [ ! -e "./$asset" ] || [ "$(hash_of "$asset")" = "$(recorded_hash "$asset")" ]; then return 1; fi
  if grep -q '^<<<<<<< ' "./$asset"; then
    complain "$asset was merged as text; say --force to merge it anew, and lose what was edited since"
  else
    complain "$asset was edited after the merge; 'git add' it as it is, or say --force to lose the edits"
  fi
}

# put_asset: standard input as the work tree's $asset.
put_asset() {
  if is_plain "$asset" && put_file "./$asset"; then return 0; fi
  complain "cannot write $asset"
  return 1
}

# settle BASE LEFT RIGHT: merges once more, with what the user decides now. Returns 0 where nothing is pending, and
# then the work tree has the merge; 2 where something is; 1 after an error.
settle() (
  base=$1 left=$2 right=$3
  if ! is_plain "$asset"; then
    complain "$asset lies behind a symbolic link, or is one or a folder, in the work tree"
    return 1
  fi
  make_record "$base" "$left" "$right" || return 1
  ! refuse_edited || return 1
  if [ -n "$side" ]; then
    decided_in "$record" >"$scratch/decided"
    list_conflicts "$base" "$left" "$right" -i "$scratch/decided" || return 1
    choose_side "$side" "$conflict_pattern" || return 1
  else
    edit "$record" || { complain "the editor failed; nothing is merged"; return 1; }
    decided_in "$record" >"$scratch/decided"
    # Who looks at the scene in the engine while deciding may save it there.
    if [ -f "$scratch/stages" ] && ! stages_of "$asset" | cmp -s - "$scratch/stages"; then
      remove_record "$asset"
      complain "$asset is no longer in the conflict that it was in when the editor was opened"
      return 1
    fi
    ! refuse_edited || return 1
  fi
  status=0
  merge_into "$scratch/merged" "$base" "$left" "$right" -i "$scratch/decided" || status=$?
  case $status in
    0) put_asset <"$scratch/merged" || return 1 ;;
    2 | 3)
      list_conflicts "$base" "$left" "$right" -i "$scratch/decided" || return 1
      return 2
      ;;
    *) return 1 ;;
  esac
)

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
  settle "$1" "$3" "$2" || status=$?
  # Git puts the old file back where we fail.
  if [ "$status" -ne 0 ] && [ -f "./$asset" ] && ! cmp -s "./$asset" "$scratch/start"; then keep_edited; fi
  case $status in
    0) remove_record "$asset" ;;
    2)
      leave_record "$asset" "$(recorded_hash "$asset")" || complain "cannot write the record of $asset"
      say "$(count_conflicts) left in $asset"
      ;;
  esac
  return "$status"
}

# keep_edited: a copy of the work tree's $asset, beside it where that can be.
keep_edited() {
  copy=$(is_plain "$asset" && mktemp "./$asset.vexel-edited.XXXXXX" 2>/dev/null) ||
    copy=$(mktemp "$(git_path vexel-edited.XXXXXX)")
  if cat "./$asset" >"$copy"; then say "The edited file is kept as ${copy#./}"; fi
}

# named_conflicts PATH: those of ours that somebody means who names a path, from here or, as git prints it, from the
# top, as a list.
named_conflicts() {
  for magic in literal 'top,literal'; do
    named=$(unmerged_below ":($magic)$1" | (go_to_top && ours_among))
    [ -z "$named" ] || break
  done
  [ -z "$named" ] || printf '%s\n' "$named"
}

# stages_of PATH: not of what lies below a folder of this name.
stages_of() {
  git_names ls-files --unmerged -- ":(literal)$1" |
    LINE=$(line_of "$1") awk 'substr($0, index($0, "\t") + 1) == ENVIRON["LINE"]'
}

# write_stages PATH: as files of the work tree, in which line ends are what the user has set.
write_stages() {
  stages_of "$1" >"$scratch/stages"
  rm -f "$scratch/base" "$scratch/left" "$scratch/right"
  while read -r mode blob stage _; do
    case $mode in
      100*) ;;
      *) complain "$1 is no file on every side: 'git add' or 'git rm' it"; return 1 ;;
    esac
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
  while IFS= read -r line <&3; do
    path_of "$line"
    asset=$path
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
  settle "$scratch/base" "$scratch/left" "$scratch/right" || status=$?
  case $status in
    0)
      stage || return 1
      remove_record "$asset"
      tell "Resolved $asset"
      ;;
    2)
      # What is settled already counts when the rest is settled in the engine.
      put_asset <"$scratch/merged" || return 1
      leave_record "$asset" "$(hash_of "$asset")" || complain "cannot write the record of $asset"
      say "$(count_conflicts) left in $asset:"
      say_conflicts
      return 1
      ;;
    *) return 1 ;;
  esac
}

# stage: adds $asset, and gives it the line ends that the user has set for files of the work tree.
stage() {
  git add -- ":(literal)$asset" || return 1
  git cat-file --filters ":0:$asset" >"$scratch/checked-out" || return 1
  if cmp -s "$scratch/checked-out" "./$asset"; then return 0; fi
  put_asset <"$scratch/checked-out" || return 1
  git add -- ":(literal)$asset"
}
