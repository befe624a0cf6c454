# The merges that vexel-merge-git makes: the merge driver, the merge tool, and resolve. Functions in round
# brackets run in a process of their own, so that their variables are theirs.

# merge_into RESULT BASE LEFT RIGHT [OPTIONS...]: leaves the record in $scratch/record, the messages, with the
# asset's own name for the temporary ones, on standard error. $asset names the asset. Returns the program's status.
merge_into() (
  result=$1 base=$2 left=$3 right=$4
  shift 4
  status=0
  "$program" merge -h --force --fallback none -o "$scratch/record" "$@" "$base" "$left" "$right" "$result" \
    2>"$scratch/messages" || status=$?
  BASE=$base LEFT=$left RIGHT=$right RECORD=${2-} ASSET=$asset awk '
    function named(name, as,   at, out) {
      out = ""
      while (name != "" && (at = index($0, name)) > 0) {
        out = out substr($0, 1, at - 1) as
        $0 = substr($0, at + length(name))
      }
      $0 = out $0
    }
    {
      named(ENVIRON["BASE"], ENVIRON["ASSET"])
      named(ENVIRON["LEFT"], ENVIRON["ASSET"] " (theirs)")
      named(ENVIRON["RIGHT"], ENVIRON["ASSET"] " (ours)")
      named(ENVIRON["RECORD"], ENVIRON["ASSET"] "'"$record_suffix"'")
      print
    }' "$scratch/messages" >&2
  return "$status"
)

# Lists what is pending, a line each, in $scratch/conflicts: path, what left did, what right did.
list_conflicts() ( # BASE LEFT RIGHT [OPTIONS...]
  base=$1 left=$2 right=$3
  shift 3
  "$reporter" --conflicts "$@" "$base" "$left" "$right" >"$scratch/conflicts"
)

count_conflicts() {
  number=$(wc -l <"$scratch/conflicts")
  if [ "$number" -eq 1 ]; then echo "1 conflict"; else echo "$((number)) conflicts"; fi
}

say_conflicts() {
  ASSET=$asset awk -F '\t' '{printf "CONFLICT %s: %s: left %s, right %s\n", ENVIRON["ASSET"], $1, $2, $3}' \
    "$scratch/conflicts" >&2
}

# Called by git with three temporary files in the top folder; the second one takes the result.
merge_driver() {
  is_ancestor=false
  if [ "${1-}" = --ancestor ]; then
    is_ancestor=true
    shift
  fi
  [ $# -eq 4 ] || wrong_usage "merge-driver is called by git"
  base=$1 ours=$2 theirs=$3 asset=$4
  make_scratch
  status=0
  if [ -s "$base" ]; then
    merge_into "$scratch/merged" "$base" "$theirs" "$ours" || status=$?
  else
    echo "error: both sides have added $asset, so there is no base to merge it with" >&2
    status=1
  fi
  # Without a work tree nobody looks for a record, and an ancestor that git makes up is nobody's file.
  keeps_records=true
  if [ "$is_ancestor" = true ] || [ "$(git rev-parse --is-inside-work-tree)" != true ]; then keeps_records=false; fi
  case $status in
    0) [ "$keeps_records" = false ] || remove_record "$asset" ;;
    2 | 3)
      if [ "$is_ancestor" = false ]; then
        # The record has them, too: no reason to lose the merge.
        list_conflicts "$base" "$theirs" "$ours" || :
        say_conflicts
      fi
      if [ "$keeps_records" = true ]; then
        leave_record "$asset" "$(hash_of "$asset" "$scratch/merged")"
        echo "$(count_conflicts), listed in $asset$record_suffix; to settle: vexel-merge-git resolve $(quoted "$asset")" >&2
      fi
      ;;
    *)
      [ "$keeps_records" = false ] || remove_record "$asset"
      echo "$asset is not merged: it is left as ours has it" >&2
      return "$status"
      ;;
  esac
  # In one step: git takes what stands there, also after a failure.
  mv -f "$scratch/merged" "$ours"
  return "$status"
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
  [ -s "$scratch/chosen" ] || { echo "error: no conflict in $asset fits '$2'" >&2; return 1; }
  if lacks_final_newline "$record"; then echo >>"$record"; fi
  cat "$scratch/chosen" >>"$record"
)

# settle RESULT BASE LEFT RIGHT: merges once more, with what the user decides now. Returns 0 where nothing is
# pending, and then RESULT holds the merge; 2 where something is; 1 after an error.
settle() (
  result=$1 base=$2 left=$3 right=$4
  record=$(record_of "$asset")
  make_record "$base" "$left" "$right" || return 1
  if [ "$force" = false ] && [ -e "./$asset" ] && [ "$(hash_of "$asset")" != "$(recorded_hash "$record")" ]; then
    echo "error: $asset was edited after the merge; 'git add' it as it is, or say --force to lose the edits" >&2
    return 1
  fi
  if [ -n "$side" ]; then
    list_conflicts "$base" "$left" "$right" -i "$record" || return 1
    choose_side "$side" "$conflict_pattern" || return 1
  else
    edit "$record" || { echo "error: the editor failed; nothing is merged" >&2; return 1; }
  fi
  status=0
  merge_into "$scratch/merged" "$base" "$left" "$right" -i "$record" || status=$?
  case $status in
    0) replace_file "$result" <"$scratch/merged" ;;
    2 | 3)
      list_conflicts "$base" "$left" "$right" -i "$record" || return 1
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
  status=0
  settle "$4" "$1" "$3" "$2" || status=$?
  if [ "$status" -eq 2 ]; then
    leave_record "$asset" "$(recorded_hash "$(record_of "$asset")")"
    echo "$(count_conflicts) left in $asset" >&2
  fi
  return "$status"
}

# unmerged_assets PATH...: those of our files below the paths that are unmerged, from the top folder, one a line.
unmerged_assets() {
  GIT_LITERAL_PATHSPECS=1 git ls-files --unmerged --full-name -z -- "$@" | tr '\0' '\n' | cut -f 2- | LC_ALL=C sort -u
}

# write_stages PATH: as files of the work tree, in which line ends are what the user has set.
write_stages() {
  GIT_LITERAL_PATHSPECS=1 git ls-files --unmerged -- "$1" >"$scratch/stages"
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
    echo "error: $1 was removed on one side: 'git add' or 'git rm' it" >&2
    return 1
  fi
  if [ ! -f "$scratch/base" ]; then
    echo "error: both sides have added $1: take one with 'git checkout --ours' or '--theirs', then 'git add' it" >&2
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
  for file in "$@"; do
    [ -n "$(unmerged_assets "$file")" ] || die "$file is not in conflict"
  done
  make_scratch
  unmerged_assets "$@" >"$scratch/assets"
  go_to_top
  outcome=0
  # Not on standard input, which is the editor's.
  while read -r asset <&3; do
    resolve_asset || outcome=1
  done 3<"$scratch/assets"
  return "$outcome"
}

# Resolves $asset, and stages it if nothing is left.
resolve_asset() {
  is_ours "$asset" || { echo "error: $asset is not ours: it has no attribute merge=vexel" >&2; return 1; }
  write_stages "$asset" || return 1
  status=0
  settle "./$asset" "$scratch/base" "$scratch/left" "$scratch/right" || status=$?
  case $status in
    0)
      GIT_LITERAL_PATHSPECS=1 git add -- "$asset" || return 1
      remove_record "$asset"
      sweep
      echo "Resolved $asset"
      ;;
    2)
      # What is settled already counts when the rest is settled in the engine.
      replace_file "./$asset" <"$scratch/merged"
      leave_record "$asset" "$(hash_of "$asset")"
      echo "$(count_conflicts) left in $asset:" >&2
      say_conflicts
      return 1
      ;;
    *) return 1 ;;
  esac
}
