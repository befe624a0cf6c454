# The records of conflicts that lie beside the assets: written by the merge driver, read by resolve, removed
# as soon as their conflict is gone. vexel-merge-git sources this file. All paths are from the top folder.

record_suffix=.vexel-conflicts
record=

# find_record PATH: sets $record to this asset's record, empty where it has none, $beside and $kept to the places for
# one, and $entry to what we remember of it. Only what is remembered is ours: a file of this name that the repository
# tracks, or that somebody else has put there, is neither read nor written. Then, and where the name would be too long
# or lies behind a symbolic link, the record is the one that is kept in git's folder. There is one in any case, since
# git checks out what the other side has added only after the merge, also over the one beside the asset.
find_record() {
  records=$(git_path vexel-merge-records)
  record_id=$(printf '%s' "$1" | git hash-object --stdin)
  beside=./$1$record_suffix
  kept=$records/$record_id$record_suffix
  entry=$records/$record_id.path
  record=
  if [ -f "$entry" ] && is_record "$beside" && is_for_us "$1$record_suffix"; then
    record=$beside
  elif [ -f "$kept" ]; then
    record=$kept
  fi
}

# is_record FILE: whether it still looks like one, also after somebody has taken one of the two lines out.
is_record() { [ -f "$1" ] && grep -q -e '^# What is in conflict in ' -e '^Conflict handling:' "$1"; }

# is_for_us PATH: a command of the user may be at work on another index.
is_for_us() (
  unset GIT_INDEX_FILE
  is_plain "$1" && [ -z "$(git ls-files -- ":(literal)$1")" ]
)

# comes_with_theirs PATH: whether a commit that git is merging has something under this name. What is picked by hand or
# popped from a stash, it tells nobody.
comes_with_theirs() (
  rebase=$(git_path rebase-merge/done)
  commits=$(env | sed -n 's/^GITHEAD_\([0-9a-f]*\)=.*/\1/p')
  [ ! -f "$rebase" ] || commits="$commits $(sed -n '$s/^[a-z]* \([0-9a-f]*\).*/\1/p' "$rebase")"
  for commit in $commits MERGE_HEAD CHERRY_PICK_HEAD REVERT_HEAD REBASE_HEAD; do
    if git cat-file -e "$commit:$1" 2>/dev/null; then return 0; fi
  done
  return 1
)

# hash_of PATH [FILE]: the blob that git would make of FILE, the work tree's file if not given, under this path.
hash_of() { git hash-object --path="$1" -- "${2-./$1}" 2>/dev/null; }

# recorded_hash PATH: of the asset as the merge left it, to see whether somebody has edited it since.
recorded_hash() (
  find_record "$1"
  [ ! -f "$entry" ] || sed -n 2p "$entry"
)

# leave_record PATH HASH: makes a record from $scratch/record and $scratch/conflicts, and sets $record. False where it
# can't.
leave_record() {
  {
    cat <<TEXT
# What is in conflict in $(printf '%s' "$1" | escaped '\n'). Left is "theirs", right is "ours".
# To settle a conflict, take the "#" off its line at the end, and leave one of the three words. Then:
#   $(resolve_call "$1")
TEXT
    cat "$scratch/record"
    cut -f 1 "$scratch/conflicts" | sed 's/^/# left|right|base /'
  } >"$scratch/new-record"
  locked place_record "$1" "$2" || return 1
  find_record "$1"
  # The record is there all the same; what is wrong with the other file has been said.
  exclude_records || :
}

# place_record PATH HASH: remembered first, so that no record is there that nobody removes.
place_record() {
  find_record "$1"
  goes_beside=false
  if [ "$record" = "$beside" ] || { [ ! -e "$beside" ] && is_for_us "$1$record_suffix"; }; then
    comes_with_theirs "$1$record_suffix" || goes_beside=true
  fi
  # The first version had a list of this name.
  [ ! -f "$records" ] || rm -f "$records"
  mkdir -p "$records" || return 1
  printf '%s\n%s\n' "$(line_of "$1")" "$2" | put_file "$entry" || return 1
  place_hook || :
  put_file "$kept" <"$scratch/new-record" || return 1
  if [ "$goes_beside" = true ] && mkdir -p "${beside%/*}" 2>/dev/null; then
    put_file "$beside" <"$scratch/new-record" || :
  fi
}

# resolve_call PATH: the command that settles the conflicts in this file.
resolve_call() (
  case $1 in
    -*) printf 'vexel-merge-git resolve -- %s\n' "$(typeable "$1")" ;;
    *) printf 'vexel-merge-git resolve %s\n' "$(typeable "$1")" ;;
  esac
)

# decided_in RECORD: what the last section says, which is the one that people edit. What stands above comes from the
# sides of the merge, and whatever it looks like, it decides nothing. Lines keep their numbers. A section that somebody
# has removed decides nothing, but can be added to.
decided_in() {
  awk 'NR == FNR {if (/^Conflict handling:\r?$/) last = FNR; next}
    {print (last && FNR >= last ? $0 : "")}
    END {if (!last) print "Conflict handling:"}' "$1" "$1"
}

# Records are for one person on one machine: git must not offer to add them. What lies behind a symbolic link
# isn't the repository's.
exclude_records() (
  exclude=$(exclude_file)
  [ -n "$exclude" ] || return 0
  state=$(common_path vexel-merge)
  set_block "$exclude" exclude "*$record_suffix"
)
exclude_file() {
  exclude=$(git_path info/exclude)
  if [ ! -h "$exclude" ] && [ ! -h "$(dirname "$exclude")" ]; then printf '%s\n' "$exclude"; fi
}

remove_record() (
  find_record "$1"
  if [ "$record" = "$beside" ]; then rm -f "$beside"; fi
  rm -f "$kept" "$entry"
)

# Git tells nobody that a merge was aborted, or a file added by hand, but it has a hook for every change of the
# index. Ours is there only as long as a record is, and never in place of another one.
hook_path() {
  hooks=$(common_path hooks)
  if [ -h "$hooks" ] || git config --get core.hooksPath >/dev/null; then return 0; fi
  printf '%s/post-index-change\n' "$hooks"
}
is_our_hook() { [ ! -h "$1" ] && [ -f "$1" ] && grep -qF 'vexel-merge-git sweep' "$1"; }

place_hook() (
  hook=$(hook_path)
  [ -n "$hook" ] || return 0
  text="#!/bin/sh
# vexel-merge-git sweep: removes the records of conflicts that are gone, and with the last one this hook.
if [ -x $(quoted "$self") ]; then exec $(quoted "$self") sweep; fi"
  if [ -e "$hook" ]; then
    if ! is_our_hook "$hook" || [ "$(cat "$hook")" = "$text" ]; then return 0; fi
  fi
  mkdir -p "$(dirname "$hook")" && printf '%s\n' "$text" | put_file "$hook" =rwx
)

# With the last record of this work tree: the hook goes, unless another one has a record. What a killed process has
# left is no record.
remove_hook() {
  rm -f "$records"/.vexel-*
  rmdir "$records" 2>/dev/null || return 0
  if has_records; then return 0; fi
  hook=$(hook_path)
  if [ -n "$hook" ] && is_our_hook "$hook"; then rm -f "$hook"; fi
}

# The paths that are unmerged, as a list. A command of the user may be at work on another index.
unmerged_paths() (
  unset GIT_INDEX_FILE
  unmerged_below
)

# Removes the records whose files are no longer unmerged. While git holds the index, a merge may be at work whose
# records are there before its conflicts: what it leaves can be swept when it is done.
sweep() (
  go_to_top
  records=$(git_path vexel-merge-records)
  if [ -d "$records" ]; then locked sweep_records; fi
)
sweep_records() {
  [ ! -e "$(git_path index.lock)" ] || return 0
  unmerged=$(unmerged_paths)
  {
    printf '%s\n\n' "$unmerged"
    find "$records" -name '*.path' -exec awk 'FNR == 1' {} +
  } | awk '$0 == "" {behind = 1; next} !behind {unmerged[$0]; next} !($0 in unmerged)' |
    while IFS= read -r line; do
      path_of "$line"
      remove_record "$path"
    done
  remove_hook
}

# Whether any work tree of this repository has a record.
has_records() (
  for folder in "$(common_path vexel-merge-records)" "$(common_path worktrees)"/*/vexel-merge-records; do
    if [ -d "$folder" ]; then return 0; fi
  done
  return 1
)
