# The records of conflicts that lie beside the assets: written by the merge driver, read by resolve, removed
# as soon as their conflict is gone. vexel-merge-git sources this file. All paths are from the top folder.

record_suffix=.vexel-conflicts

record_of() { printf './%s%s\n' "$1" "$record_suffix"; }

# The paths that have a record, one a line.
record_list() { git_path vexel-merge-records; }

# hash_of PATH [FILE]: the blob that git would make of FILE, the work tree's file if not given, under this path.
hash_of() { git hash-object --path="$1" -- "${2-./$1}" 2>/dev/null; }

# recorded_hash RECORD: of the asset as the merge left it, to see whether somebody has edited it since.
recorded_hash() { [ ! -f "$1" ] || sed -n 's/^# merged: //p' "$1" | head -n 1; }

# leave_record PATH HASH: makes a record from $scratch/record and $scratch/conflicts. False where it can't.
leave_record() (
  record=$(record_of "$1")
  {
    cat <<TEXT
# What is in conflict in $1. Left is "theirs", right is "ours".
# To settle a conflict, take the "#" off its line at the end, and leave one of the three words. Then:
#   vexel-merge-git resolve $(quoted "$1")
# merged: $2
TEXT
    cat "$scratch/record"
    cut -f 1 "$scratch/conflicts" | sed 's/^/# left|right|base /'
  } >"$scratch/new-record"
  mkdir -p "$(dirname "$record")" && cp "$scratch/new-record" "$record.new" && mv -f "$record.new" "$record" &&
    watch_record "$1" || return 1
  # The record is there all the same; what is wrong with the other file has been said.
  exclude_records || :
)

# Records are for one person on one machine: git must not offer to add them. What lies behind a symbolic link
# isn't the repository's.
exclude_records() (
  exclude=$(git_path info/exclude)
  if [ -h "$exclude" ] || [ -h "$(dirname "$exclude")" ]; then return 0; fi
  state=$(git rev-parse --git-common-dir)/vexel-merge
  set_block "$exclude" exclude "*$record_suffix"
)

remove_record() { rm -f "$(record_of "$1")"; }

# Git tells nobody that a merge was aborted, or a file added by hand, but it has a hook for every change of the
# index. Ours is there only as long as a record is, and never in place of another one.
hook_path() {
  hooks=$(git rev-parse --git-common-dir)/hooks
  if [ -h "$hooks" ] || git config --get core.hooksPath >/dev/null; then return 0; fi
  printf '%s/post-index-change\n' "$hooks"
}
is_our_hook() { [ -f "$1" ] && grep -qF 'vexel-merge-git sweep' "$1"; }

watch_record() (
  list=$(record_list)
  if ! { [ -f "$list" ] && grep -qxF -e "$1" "$list"; }; then printf '%s\n' "$1" >>"$list"; fi
  hook=$(hook_path)
  if [ -z "$hook" ] || { [ -e "$hook" ] && ! is_our_hook "$hook"; }; then return 0; fi
  mkdir -p "$(dirname "$hook")"
  cat >"$hook" <<TEXT
#!/bin/sh
# vexel-merge-git sweep: removes the records of conflicts that are gone, and with the last one this hook.
if [ -x $(quoted "$self") ]; then exec $(quoted "$self") sweep; fi
TEXT
  chmod +x "$hook"
)

# The paths that are unmerged, one a line. A command of the user may be at work on another index.
unmerged_paths() (
  unset GIT_INDEX_FILE
  git ls-files --unmerged -z | tr '\0' '\n' | cut -f 2- | LC_ALL=C sort -u
)

# Removes the records whose files are no longer unmerged.
sweep() (
  go_to_top
  list=$(record_list)
  [ -f "$list" ] || return 0
  unmerged_paths >"$list.unmerged"
  LC_ALL=C sort -u "$list" | LC_ALL=C comm -23 - "$list.unmerged" |
    while IFS= read -r path; do remove_record "$path"; done
  LC_ALL=C sort -u "$list" | LC_ALL=C comm -12 - "$list.unmerged" >"$list.new"
  rm -f "$list.unmerged"
  mv -f "$list.new" "$list"
  [ ! -s "$list" ] || return 0
  rm -f "$list"
  if has_records; then return 0; fi
  hook=$(hook_path)
  if [ -n "$hook" ] && is_our_hook "$hook"; then rm -f "$hook"; fi
)

# Whether any work tree of this repository has a record; each has a list of its own.
has_records() (
  common=$(git rev-parse --git-common-dir)
  for list in "$common/vexel-merge-records" "$common"/worktrees/*/vexel-merge-records; do
    if [ -f "$list" ]; then return 0; fi
  done
  return 1
)
