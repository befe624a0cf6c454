# Files that are written where others may have put something under any name. vexel-merge-git sources this file.

# put_file TARGET [MODE]: standard input as this file, whole or not at all. A file that is there keeps its permissions,
# a new one gets MODE. False where it can't, also for a folder or a symbolic link, which could lead anywhere. The work
# file's name can't be foreseen, so that no repository can have one of that name.
put_file() (
  if [ -h "$1" ] || [ -d "$1" ]; then return 1; fi
  new=$(mktemp "${1%/*}/.vexel-XXXXXX" 2>/dev/null) || return 1
  trap 'rm -f "$new"' EXIT
  trap 'exit 1' HUP INT TERM
  if [ -e "$1" ]; then cp -p "$1" "$new"; else chmod "${2:-=rw}" "$new"; fi &&
    cat >"$new" && mv -f "$new" "$1" 2>/dev/null
)

# replace_file FILE: the same for a file of the user's own, whose symbolic links are meant to be followed.
replace_file() { put_file "$(target_of "$1")" || die "cannot write $1"; }

# is_plain PATH: whether a path of the work tree, which is the current folder, is a file or free, and no folder on its
# way is a symbolic link. What lies behind a link isn't the repository's.
is_plain() (
  way=. rest=$1
  while :; do
    way=$way/${rest%%/*}
    if [ -h "$way" ]; then return 1; fi
    case $rest in
      */*) rest=${rest#*/} ;;
      *) break ;;
    esac
  done
  [ ! -e "$way" ] || [ -f "$way" ]
)

lacks_final_newline() { [ -s "$1" ] && [ -n "$(tail -c 1 "$1")" ]; }

go_to_top() {
  top=$(git rev-parse --show-toplevel) || exit 128
  cd "$top" || exit 1
}

# git_path NAME: where the repository keeps this file of its own.
git_path() { git rev-parse --git-path "$1"; }

# Sets $scratch to a new folder, which goes with the process. In the repository, where nobody else looks and
# where there is as much room as the files themselves take.
make_scratch() {
  scratch=$(mktemp -d "$(git rev-parse --absolute-git-dir)/vexel-merge.XXXXXX")
  trap 'rm -rf "$scratch"' EXIT
  trap 'exit 129' HUP
  trap 'exit 130' INT
  trap 'exit 143' TERM
}

# locked COMMAND...: while no other process of ours is in here, from whichever work tree of the repository. One that was
# killed may have left the lock: nobody holds it for long, so that after ten seconds it doesn't count any more.
locked() (
  lock=$(git rev-parse --git-common-dir)/vexel-merge.lock
  tries=0
  until mkdir "$lock" 2>/dev/null || [ "$tries" -ge 100 ]; do
    tries=$((tries + 1))
    sleep 0.1
  done
  trap 'rmdir "$lock" 2>/dev/null || :' EXIT
  trap 'exit 1' HUP INT TERM
  "$@"
)
