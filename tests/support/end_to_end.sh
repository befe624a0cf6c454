# Sourced by the tests that run the program as a version control runs it: a folder and a home of their own, helpers.
# The sourcing script's first argument is the program; git's, Subversion's and Mercurial's clients are the real ones.
# shellcheck shell=bash

program="$(cd "$(dirname "$1")" && pwd)/$(basename "$1")"
# shellcheck disable=SC2034  # for the scripts that source this
project="$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)"
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT

# Nothing of the user's own set-up may decide here, least of all a merge tool or an editor that waits for somebody.
for name in $(compgen -e GIT_ || true) $(compgen -e HG || true) $(compgen -e SVN_ || true) VISUAL EDITOR; do
  unset "$name"
done
export HOME="$work/home" PATH="${program%/*}:$PATH" LC_ALL=C.UTF-8 GIT_CONFIG_NOSYSTEM=1
export GIT_AUTHOR_NAME=Test GIT_AUTHOR_EMAIL=test@localhost GIT_COMMITTER_NAME=Test GIT_COMMITTER_EMAIL=test@localhost
unset XDG_CONFIG_HOME
mkdir "$HOME"
# Somebody who runs a test by hand is not to be asked anything.
exec </dev/null
# Nor is a page to be opened.
unset DISPLAY WAYLAND_DISPLAY CI

# To the standard error of the test itself: what is sent elsewhere is the checked command's.
exec 3>&2
failures=0
check() { # check WHAT COMMAND...
  if ! "${@:2}"; then
    echo "FAILED: $1" >&3
    failures=$((failures + 1))
  fi
}
# A crash, or a program that can't be run, refuses nothing. (git's own refusals end with 128, Mercurial's with 255.)
refuses() {
  local status=0
  "$@" || status=$?
  case $status in
    0 | 126 | 127) return 1 ;;
    128 | 255) return 0 ;;
    *) [[ $status -lt 128 ]] ;;
  esac
}
# shows PAGE FILE: the page has the lines that FILE sets, so that readers who copy them get what is tested.
shows() { [[ "$(<"$1")" == *"$(sed '/^#/d' "$2")"* ]]; }
end_of_checks() { # end_of_checks TEXT: the last line of a test, whose status is the test's
  [[ "$failures" -eq 0 ]] && echo "$1"
}

# scene INTENSITY RANGE: the two values stand on neighbouring lines, where a textual merge gives up.
scene() {
  cat <<SCENE
%YAML 1.1
%TAG !v! tag:vexel.com,2011:
--- !v!1 &10
GameObject:
  m_Component:
  - component: {fileID: 11}
  m_Name: Lamp
--- !v!108 &11
Light:
  m_GameObject: {fileID: 10}
  m_Intensity: $1
  m_Range: $2
SCENE
}
