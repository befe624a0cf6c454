# Hands the files of a merge to a tool that can be used here: sh merge-tool.sh BASE LEFT RIGHT RESULT. Status 0 means
# that RESULT is merged. The default mergespecfile.txt starts it.
# shellcheck shell=sh
set -u

# A path that begins with "-" would be an option of the tool, and one with a ":" perhaps an address.
for path do
  case $path in
    /*) ;;
    *) path=./$path ;;
  esac
  set -- "$@" "$path"
  shift
done
base=$1 left=$2 right=$3 result=$4

# use TOOL ARGUMENT...: where the tool is installed, it decides, and nothing below is tried.
use() {
  [ -f "$1" ] && [ -x "$1" ] || return 0
  # Several tools end with 0 also when they are closed without saving.
  "$@" && [ -s "$result" ]
  exit
}

# Build servers set CI. Some have a display or a terminal, but nobody who looks at it.
has_display() { [ -z "${CI-}" ] && { [ -n "${DISPLAY-}${WAYLAND_DISPLAY-}" ] || [ "$(uname)" = Darwin ]; }; }
has_terminal() { [ -z "${CI-}" ] && [ "${TERM:-dumb}" != dumb ] && (: <>/dev/tty) 2>/dev/null; }

# What was merged by structure is settled on a page, from what that merge began with: its result has one side's values
# at the conflicts.
settle_on_page() {
  [ -n "${VEXEL_LEFT-}" ] && [ -z "${SSH_CONNECTION-}" ] || return 0
  set -- --title "${VEXEL_DESTINATION:-$result}"
  [ -n "${VEXEL_SAFE-}" ] || set -- "$@" --plain
  [ -z "${VEXEL_RULES-}" ] || set -- "$@" --rules "$VEXEL_RULES"
  [ -z "${VEXEL_TYPE_INFO-}" ] || set -- "$@" --typeInfo "$VEXEL_TYPE_INFO"
  [ -z "${VEXEL_CHOICES-}" ] || set -- "$@" -i "$VEXEL_CHOICES"
  [ -z "${VEXEL_RECORD-}" ] || set -- "$@" -o "$VEXEL_RECORD"
  # Standard output is for the records of the merge.
  use "${VEXEL_DATA_FILES-}/vexel-merge-view" "$@" -- "$VEXEL_BASE" "$VEXEL_LEFT" "$VEXEL_RIGHT" "$result" >&2
}

if has_display; then
  case $left in
    /tmp/MERGE*) settle_on_page ;;
  esac
  for programs in "${HOME-}/Applications" /Applications; do
    use "$programs/kdiff3.app/Contents/MacOS/kdiff3" "$base" "$left" "$right" -o "$result"
    use "$programs/p4merge.app/Contents/MacOS/p4merge" "$base" "$left" "$right" "$result"
    use "$programs/Meld.app/Contents/MacOS/Meld" --output "$result" "$left" "$base" "$right"
    use "$programs/Beyond Compare.app/Contents/MacOS/bcomp" "$left" "$right" "$base" "-mergeoutput=$result"
  done
  use /opt/homebrew/bin/meld --output "$result" "$left" "$base" "$right"
  use /usr/bin/kdiff3 "$base" "$left" "$right" -o "$result"
  use /usr/bin/meld --output "$result" "$left" "$base" "$right"
  use /usr/bin/p4merge "$base" "$left" "$right" "$result"
  use /usr/local/bin/p4merge "$base" "$left" "$right" "$result"
  use /usr/bin/bcompare "$left" "$right" "$base" "-mergeoutput=$result"
  use /usr/bin/tkdiff -a "$base" -o "$result" "$left" "$right"
fi

if has_terminal; then
  # It reads from the terminal itself, never from the standard input of the run. Its lower window is the result,
  # which begins as the left file: write and leave with :wqa, or leave the conflict as it is with :cquit. Neither
  # settings inside the files count nor swap files beside them, since both may come from a repository.
  use /usr/bin/vimdiff -f -n --cmd 'set nomodeline' \
    -c 'wincmd b | call setline(1, getbufline(2, 1, "$")) | wincmd J | diffupdate' \
    -- "$base" "$left" "$right" "$result" </dev/tty >/dev/tty
fi

case $left in
  # After a structural merge, left is a temporary file. What is left are real conflicts then, and where text sees
  # none, it has just dropped left's edit.
  /tmp/MERGE*) ;;
  # The status is the number of conflicts, so that a file with conflict markers is never taken for a merged one.
  *)
    for git in /usr/local/bin/git /usr/bin/git; do
      if [ -x "$git" ]; then
        "$git" merge-file -p -- "$left" "$base" "$right" >"$result"
        exit
      fi
    done
    ;;
esac

if has_display || has_terminal; then
  echo "No merge tool was started: none is installed that works here, see mergespecfile.txt(5)" >&2
else
  echo "No merge tool was started: there is no display, no terminal, or nobody who looks at them" >&2
fi
exit 1
