#!/usr/bin/env bash
# Runs the program as Subversion runs it, with the set-up that the manual tells its readers to copy:
#   svn_end_to_end.sh PROGRAM
set -euo pipefail
# shellcheck source=tests/support/end_to_end.sh
source "$(dirname "${BASH_SOURCE[0]}")/support/end_to_end.sh"

config="$project/integrations/subversion/config"
export PATH="$project/integrations/subversion:$PATH"
mkdir -p "$HOME/.subversion" && cp "$config" "$HOME/.subversion/config"
for page in docs/subversion.md README.md; do check "$page shows the set-up" shows "$project/$page" "$config"; done
# As on a machine that has no other merge tool; what this one has would open a window or the terminal.
echo "# no tool" >"$HOME/.mergespecfile.txt"

file="Küche/Main Scene.vexel"
url="file://$work/svn"
svnadmin create "$work/svn" && svn mkdir -q -m layout "$url/trunk" "$url/branches"
svn checkout -q "$url/trunk" "$work/mine" && mkdir "$work/mine/Küche"
scene 2 10 >"$work/mine/$file"
svn add -q "$work/mine/Küche" && svn commit -q -m base "$work/mine"
svn copy -q -m branch "$url/trunk" "$url/branches/wide"
svn checkout -q "$url/trunk" "$work/theirs"
svn checkout -q "$url/branches/wide" "$work/branch"

# lamp INTENSITY RANGE FILE_ID...: the scene and a script for each file ID. Two people who append one each are a
# conflict for Subversion, which then starts the program; edits of neighbouring lines it would merge itself.
lamp() {
  scene "$1" "$2"
  printf -- '--- !v!114 &%s\nMonoBehaviour:\n  speed: 1\n' "${@:3}"
}
save() { # save FOLDER INTENSITY RANGE FILE_ID...: edit the scene there and commit
  lamp "${@:2}" >"$work/$1/$file" && svn commit -q -m "$*" "$work/$1"
}
launch() { svn "$@" --force-interactive --accept=launch </dev/null >"$work/log" 2>&1; }
state() { svn status "$work/mine/Küche" | grep -v '^[S? ]'; }
has() { cmp "$work/mine/$file" <(lamp "$@"); }
cd "$work/mine"

save theirs 2 40 21
lamp 5 10 22 >"$file"
check "an update starts the merge" launch update
check "Subversion takes the result" grep -q "marked as resolved" "$work/log"
check "it sees a modified file and no conflict" test "$(state)" = "M       $work/mine/$file"
check "the file has what both did" has 5 40 21 22
svn commit -q -m merged && svn update -q

save branch 2 10 23
check "a merge of a branch starts the merge" launch merge "$url/branches/wide"
check "the file has what the branch did" has 5 40 23 21 22
svn commit -q -m merged

svn update -q "$work/theirs"
save theirs 3 60 23 21 22
lamp 7 40 23 21 22 >"$file"
check "an update with a conflict ends" launch update
check "the user sees the conflict" grep -qFx "Left  11.Light.m_Intensity change to 3" "$work/log"
check "Subversion keeps the conflict" test "$(state)" = "C       $work/mine/$file"
check "nobody can commit it" refuses svn commit -q -m early 2>/dev/null
check "mine is kept" cmp "$file.mine" <(lamp 7 40 23 21 22)

versions=("$file".r[0-9]* "$file".mine)
settle() { VexelYAMLMerge merge -h --force --safe --fallback none "$@" "${versions[@]}" "$file" >/dev/null; }
check "merging by hand leaves the conflict" refuses settle -o "$work/records.txt"
check "but the engine can open the result" has 5 60 23 21 22
echo "right 11.Light.m_Intensity" >>"$work/records.txt"
check "a choice settles it" settle -i "$work/records.txt"
check "it has mine where that was chosen, and theirs elsewhere" has 7 60 23 21 22
svn resolve -q --accept=working "$file"
check "it can be committed" svn commit -q -m settled

# The script of the manual, for rules of one's own: here with one that makes a light one unit.
sed -n '/^```sh$/,/^```$/p' "$project/docs/subversion.md" | sed -n '/^#!/,/^```$/{/^```$/!p;}' >"$HOME/merge-with-rules"
chmod +x "$HOME/merge-with-rules"
printf '[exclusions]\nexclude *.Light\n' >"$HOME/our_rules.txt"
svn update -q "$work/theirs" && save theirs 7 80 23 21 22 24
lamp 8 60 23 21 22 25 >"$file"
check "a script can pass rules" launch update --config-option "config:helpers:merge-tool-cmd=$HOME/merge-with-rules"
check "they count" grep -q "^Left  11.Light *$" "$work/log"
check "Subversion keeps the conflict then, too" test "$(state)" = "C       $work/mine/$file"
check "and the file can be opened" has 7 60 23 21 22 24 25

end_of_checks "Subversion merges through the program"
