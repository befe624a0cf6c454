# The merges that vexel-merge-git makes, and the merge driver. vexel-merge-git sources this file.
# Functions in round brackets run in a process of their own, so that their variables are theirs.

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
      *) value=$PWD/$value ;;
    esac
    options="$options --$option $(quoted "$value")"
  done
}

# say_messages BASE LEFT RIGHT [OPTIONS...]: $scratch/messages, with the asset's own name for the temporary ones.
say_messages() {
  BASE=$1 LEFT=$2 RIGHT=$3 OPTIONS=$* ASSET=$(shown "$asset") RECORD=$(shown "${record#./}") awk '
    function named(name, as,   at, out) {
      out = ""
      while (name != "" && (at = index($0, name)) > 0) {
        out = out substr($0, 1, at - 1) as
        $0 = substr($0, at + length(name))
      }
      $0 = out $0
    }
    # Of a mistake in the record, whose line is named.
    index(ENVIRON["OPTIONS"], " -i ") && / specified on line [0-9]+/ {
      if (match($0, /^.*Cannot merge file .*\047: /)) $0 = ENVIRON["RECORD"] ": " substr($0, RLENGTH + 1)
      # It is read from a copy.
      sub(/ \(in merge resolve file .*$/, "")
    }
    {
      named("\047" ENVIRON["BASE"] "\047", "\047" ENVIRON["ASSET"] "\047")
      named("\047" ENVIRON["LEFT"] "\047", "\047" ENVIRON["ASSET"] "\047 (theirs)")
      named("\047" ENVIRON["RIGHT"] "\047", "\047" ENVIRON["ASSET"] "\047 (ours)")
      print
    }' "$scratch/messages" | say_lines
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
  # The program's messages are for scripts. The reporter's also name the line and the object.
  if [ "$status" -eq 1 ] &&
    ! "$reporter" --conflicts "$@" "$base" "$left" "$right" >/dev/null 2>"$scratch/explained" &&
    [ -s "$scratch/explained" ]; then
    sed 's/^vexel-merge-report: //' "$scratch/explained" >"$scratch/messages"
  fi
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
  ASSET=$(shown "$asset") awk -F '\t' '{printf "CONFLICT %s: %s: left %s, right %s\n", ENVIRON["ASSET"], $1, $2, $3}' \
    "$scratch/conflicts" | say_lines
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
  # A record without the lines to choose from would say that there is no conflict; resolve makes a whole one.
  if ! list_conflicts "$@"; then
    [ "$keeps_records" = false ] || remove_record "$asset"
    complain "cannot list the conflicts in $asset; to settle: $(resolve_call "$asset")"
    return 0
  fi
  say_conflicts
  [ "$keeps_records" = true ] || return 0
  if leave_record "$asset" "$(hash_of "$asset" "$scratch/merged")"; then
    say "$(count_conflicts), listed in ${record#./}; to settle: $(resolve_call "$asset")"
  else
    complain "cannot write the record of $asset"
  fi
}
