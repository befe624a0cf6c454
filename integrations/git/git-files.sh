# Files that are written where others may have put something under any name. vexel-merge-git sources this file.

# put_file TARGET [MODE]: standard input as this file, whole or not at all. A file that is there keeps its permissions,
# a new one gets MODE. False where it can't, also for a folder or a symbolic link, which could lead anywhere. The work
# file's name can't be foreseen, so that no repository can have one of that name.
put_file() (
  if [ -h "$1" ] || [ -d "$1" ]; then return 1; fi
  new=$(mktemp "${1%/*}/.vexel-XXXXXX" 2>/dev/null) || return 1
  trap 'rm -f "$new"' EXIT
  trap 'exit 1' HUP INT TERM
  if [ -e "$1" ]; then cp -p "$1" "$new" 2>/dev/null; else chmod "${2:-=rw}" "$new"; fi || return 1
  guard=
  if [ ! -w "$new" ]; then guard=u-w && chmod u+w "$new"; fi
  cat >"$new" || return 1
  [ -z "$guard" ] || chmod "$guard" "$new"
  mv -f "$new" "$1" 2>/dev/null
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

# leaves_top PATH: whether a symbolic link of the work tree, which is at $top, is on the way to this absolute path.
leaves_top() (
  way=$1
  while [ -n "$way" ]; do
    if [ -h "$way" ] && cd -P "${way%/*}/"; then
      case $PWD/ in
        "${top%/}"/*) return 0 ;;
      esac
    fi
    way=${way%/*}
  done
  return 1
)

lacks_final_newline() { [ -s "$1" ] && [ -n "$(tail -c 1 "$1")" ]; }

# A command's output loses the line breaks at its end, which a folder's name can have: another folder may be left.
go_to_top() {
  top=$(git rev-parse --show-toplevel && echo .) || exit 128
  top=${top%??}
  cd "$top" || exit 1
}

# common_path NAME: the same for all work trees of the repository.
common_path() (
  common=$(git rev-parse --git-common-dir && echo .) || exit 128
  printf '%s/%s\n' "${common%??}" "$1"
)

# git_path NAME: where the repository keeps this file of its own.
git_path() { git rev-parse --git-path "$1"; }

# Sets $scratch to a new folder, which goes with the process. In the repository, where nobody else looks and
# where there is as much room as the files themselves take.
make_scratch() {
  scratch=$(git rev-parse --absolute-git-dir && echo .)
  scratch=$(mktemp -d "${scratch%??}/vexel-merge.XXXXXX")
  trap 'rm -rf "$scratch"' EXIT
  trap 'exit 129' HUP
  trap 'exit 130' INT
  trap 'exit 143' TERM
}

# locked COMMAND...: while no other process of ours is in here, from whichever work tree of the repository. One that was
# killed may have left the lock: nobody holds it for long, so that after ten seconds it doesn't count any more.
locked() (
  lock=$(common_path vexel-merge.lock)
  tries=0
  until mkdir "$lock" 2>/dev/null || [ "$tries" -ge 100 ]; do
    tries=$((tries + 1))
    [ "$tries" -ne 10 ] || say "waiting for $lock: another vexel-merge-git has it, or one that was killed has left it"
    sleep 0.1
  done
  trap 'rmdir "$lock" 2>/dev/null || :' EXIT
  trap 'exit 1' HUP INT TERM
  "$@"
)
