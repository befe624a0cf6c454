#!/usr/bin/env bash
# Runs the program as git and Subversion run it, with the set-up that README.md tells its readers to make:
#   git_end_to_end.sh PROGRAM
set -euo pipefail

program="$(cd "$(dirname "$1")" && pwd)/$(basename "$1")"
project="$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)"
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT

# Nothing of the user's own set-up may decide here, least of all a merge tool that opens a window.
for name in $(compgen -e GIT_ || true) SVN_MERGE; do unset "$name"; done
export HOME="$work/home" GIT_CONFIG_NOSYSTEM=1 PATH="${program%/*}:$PATH"
export GIT_AUTHOR_NAME=Test GIT_AUTHOR_EMAIL=test@localhost GIT_COMMITTER_NAME=Test GIT_COMMITTER_EMAIL=test@localhost
mkdir "$HOME"

failures=0
check() { # check WHAT COMMAND...
  if ! "${@:2}"; then
    echo "FAILED: $1" >&2
    failures=$((failures + 1))
  fi
}
refuses() { ! "$@"; }
has_line() { grep -qFx "  $2" "$1"; }

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

# A blank in the path, because the driver's command line passes through a shell.
file="Assets/Main Scene.vexel"
record=".git/vexel-conflicts/$file"

commit() { # commit BRANCH INTENSITY RANGE, on top of "start" unless the branch exists
  git checkout -q "$1" 2>/dev/null || git checkout -q -b "$1" start
  scene "$2" "$3" >"$file"
  git commit -q -a -m "$1"
}

mkdir "$work/repository" && cd "$work/repository"
git init -q
# The lines as they stand in the README.
grep '^git config merge\.vexel\.' "$project/README.md" >"$work/setup"
check "the README configures a name and a driver" test "$(wc -l <"$work/setup")" -eq 2
source "$work/setup"
check "integrations/git/gitconfig and the README have the same driver" test \
  "$(git config merge.vexel.driver)" = "$(git config -f "$project/integrations/git/gitconfig" merge.vexel.driver)"
grep ' merge=vexel$' "$project/README.md" >.gitattributes
mkdir Assets
scene 2 10 >"$file"
git add -A && git commit -q -m base && git branch start

commit brighter 5 10
commit wider 2 40
commit darker 1 10

git checkout -q -b merged brighter
check "a merge without conflict succeeds" git merge -q --no-edit wider
check "it has ours" has_line "$file" "m_Intensity: 5"
check "it has theirs" has_line "$file" "m_Range: 40"
check "it leaves a clean work tree" test -z "$(git status --porcelain)"

git checkout -q -b conflicting brighter
check "a merge with a conflict fails" refuses git merge -q --no-edit darker >/dev/null
check "the file is unmerged" test "$(git status --porcelain)" = "UU \"$file\""
check "its three versions are in the index" test "$(git ls-files -u | wc -l)" -eq 3
check "the file can still be opened by the engine" refuses grep -q '^<<<<<<<' "$file"
check "the record names the place" grep -qF "Left  11.Light.m_Intensity" "$record"
git merge --abort

git checkout -q -b rebased wider
check "a rebase succeeds" git rebase -q brighter
check "the rebased file is the merged one" cmp -s "$file" <(git show "merged:$file")

git checkout -q -b picked brighter
check "a cherry-pick succeeds" git cherry-pick wider >/dev/null
check "the file is the merged one after it" cmp -s "$file" <(git show "merged:$file")

# Subversion: an update meets a textual conflict and starts the tool with its five paths.
mkdir -p "$HOME/.subversion" && cp "$project/integrations/subversion/config" "$HOME/.subversion/config"
svn_file="Main Scene.vexel"
svnadmin create "$work/svn"
svn checkout -q "file://$work/svn" "$work/mine"
scene 2 10 >"$work/mine/$svn_file"
svn add -q "$work/mine/$svn_file" && svn commit -q -m base "$work/mine"
svn checkout -q "file://$work/svn" "$work/theirs"
scene 2 40 >"$work/theirs/$svn_file" && svn commit -q -m wider "$work/theirs"
scene 5 10 >"$work/mine/$svn_file"
check "svn update starts the merge" svn update --force-interactive --accept=launch "$work/mine" \
  </dev/null >"$work/svn.log" 2>&1
check "Subversion sees a modified file and no conflict" test "$(svn status "$work/mine")" = "M       $work/mine/$svn_file"
check "the file has mine" has_line "$work/mine/$svn_file" "m_Intensity: 5"
check "the file has theirs" has_line "$work/mine/$svn_file" "m_Range: 40"

[[ "$failures" -eq 0 ]] || cat "$work/svn.log" >&2
[[ "$failures" -eq 0 ]] && echo "git and Subversion merge through the driver"
