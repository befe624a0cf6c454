#!/usr/bin/env bash
# Runs the programs as git runs them, set up by vexel-merge-git, in a repository of its own:
#   git_end_to_end.sh PROGRAM
set -euo pipefail
# shellcheck source=tests/support/end_to_end.sh
source "$(dirname "${BASH_SOURCE[0]}")/support/end_to_end.sh"

file="Assets/Küche/Main Scene.vexel"
record="$file.vexel-conflicts"

commit() { # commit BRANCH INTENSITY RANGE, on top of "start"
  git checkout -q -b "$1" start
  scene "$2" "$3" >"$file"
  git commit -q -a -m "$1"
}
# merge_darker: into "brighter", which has changed the same value, so that one conflict is left.
merge_darker() { git checkout -q brighter && refuses git merge -q --no-edit darker >"$work/out" 2>"$work/err"; }
is_unmerged() { [ "$(git status --porcelain | cut -c 1-2)" = UU ]; }
# Nothing is left of us but what the repository had before.
has_no_record() {
  [ ! -e "$record" ] && [ ! -e .git/vexel-merge-records ] && ! grep -lq vexel-merge-git .git/hooks/* 2>/dev/null
}
# Permissions bind root, too, who has given up the power over them.
as_owner=()
if [[ $EUID == 0 ]]; then as_owner=(setpriv --bounding-set=-dac_override); fi
value_is() { grep -qFx "  m_Intensity: $1" "$file"; }

mkdir "$work/repository" && cd "$work/repository"
git init -q -b main
# Not ours, and not to be touched: a driver of that name, an attribute line without an end.
printf '[merge "vexel"]\n\tdriver = something else  # and why\n' >>.git/config
printf '*.png binary' >.gitattributes
cp .git/config "$work/config"
cp .gitattributes "$work/attributes"
cp .git/info/exclude "$work/exclude"

check "without a set-up the status is 1" refuses vexel-merge-git status >/dev/null
vexel-merge-git enable --patterns '*.vexel' >/dev/null
cp .git/config "$work/enabled"
cp .gitattributes "$work/enabled-attributes"
check "the set-up is complete" vexel-merge-git status >"$work/status"
check "the status names the version" grep -q '^program  *VexelYAMLMerge [0-9.]* (' "$work/status"
check "without a home, too" cmp "$work/status" <(env -u HOME vexel-merge-git status 2>&1)
check "each command has the help" cmp -s <(vexel-merge-git resolve --help) <(vexel-merge-git --help)
vexel-merge-git enable >/dev/null
check "a second time changes no setting" cmp -s .git/config "$work/enabled"
check "a second time changes no attribute" cmp -s .gitattributes "$work/enabled-attributes"
check "foreign attributes stay" test "$(git check-attr binary x.png)" = "x.png: binary: set"
vexel-merge-git disable >/dev/null
check "the configuration is restored" cmp .git/config "$work/config"
check "the attributes are restored" cmp .gitattributes "$work/attributes"
check "the excluded files are restored" cmp .git/info/exclude "$work/exclude"
check "no state is left" test ! -e .git/vexel-merge
# A block that is longer than an argument may be, and a pattern that no name can be made of.
sed "1,20000s|.*|Assets/Scenes/*.vexel merge=vexel|; 1i $(grep begin "$work/enabled-attributes")" <(seq 20000) >.gitattributes
echo '# vexel-merge-git end' >>.gitattributes && cp .gitattributes "$work/long"
vexel-merge-git enable --patterns '*.d/[a-z]*.vexel' >/dev/null
check "a pattern with a folder counts" vexel-merge-git status >/dev/null
vexel-merge-git disable >/dev/null
check "a long block is restored" cmp -s .gitattributes "$work/long"
cp "$work/attributes" .gitattributes

git config --unset merge.vexel.driver
# For all repositories: the only set-up that writes outside of this one.
vexel-merge-git enable --global >/dev/null
check "a global set-up is found" vexel-merge-git status >/dev/null
check "it gives us the three kinds of files" test "$(git check-attr merge x.prefab)" = "x.prefab: merge: vexel"
vexel-merge-git disable --global >/dev/null
check "nothing of it is left" test -z "$(find "$HOME" -type f)"
# Relative folders are meant from where the call was made.
git init -q inner && mkdir inner/sub
(cd inner/sub && GIT_DIR=../.git GIT_WORK_TREE=.. vexel-merge-git enable >/dev/null)
check "the named repository is set up" git config -f inner/.git/config merge.vexel.driver >/dev/null
rm -rf inner

vexel-merge-git enable >/dev/null
mkdir -p "${file%/*}"
scene 2 10 >"$file"
git add -A && git commit -q -m base && git branch start
commit brighter 5 10
commit wider 2 40
commit darker 1 10

check "git log shows whose value was changed" grep -qx '@@.*@@ GameObject &10 "Lamp"' <(git log -p -1 brighter)
check "git diff names the object in its lines" grep -qx ' --- Light &11 of "Lamp"' <(git diff start brighter)

git checkout -q -b merged brighter
check "a merge without conflict succeeds" git merge -q --no-edit wider
check "it has both values" cmp "$file" <(scene 5 40)
check "it leaves a clean work tree" test -z "$(git status --porcelain)"
git checkout -q -b rebased wider
check "a rebase succeeds" git rebase -q brighter
check "the rebased file is the merged one" cmp -s "$file" <(scene 5 40)
git checkout -q -b picked brighter
check "a cherry-pick succeeds" git cherry-pick wider >/dev/null
check "the file is the merged one after it" cmp -s "$file" <(scene 5 40)
git checkout -q -b popped start && scene 5 10 >"$file" && git stash -q && git merge -q --ff-only wider
check "so does git stash pop" git stash pop -q
check "the file is the merged one then, too" cmp -s "$file" <(scene 5 40)
git reset -q --hard

check "a conflict stops the merge" merge_darker
check "the file is unmerged, and the record isn't seen" is_unmerged
check "it can still be opened by the engine" cmp "$file" <(scene 2 10)
check "git's messages name the place and the branch" \
  grep -qFx "CONFLICT $file: Lamp > Light > m_Intensity: was 2, theirs (darker) 1, ours 5" "$work/err"
check "the record names it, too" grep -qF "Left  11.Light.m_Intensity change to 1" "$record"
cp "$record" "$work/record"
git merge-tree --write-tree brighter wider >/dev/null
GIT_INDEX_FILE="$work/index" git read-tree HEAD
check "a merge that only looks, or another index, leaves the record alone" cmp "$record" "$work/record"
git merge --abort
check "an aborted merge leaves no record" has_no_record

check "the conflict comes again" merge_darker
check "an editor that changes nothing settles nothing" refuses env GIT_EDITOR=true vexel-merge-git resolve "$file" 2>/dev/null
check "the file is still unmerged" is_unmerged
check "a mistake is named with its line" refuses env GIT_EDITOR="sed -i 's/^# theirs.ours.base/up/'" \
  vexel-merge-git resolve "$file" 2>"$work/err"
check "in the record's own name" grep -q "^error: $file.*'up'.* on line [0-9]*; " "$work/err"
cd Assets
check "the editor's choice is merged" env GIT_EDITOR="sed -i 's/^up/ours/'" vexel-merge-git resolve . >/dev/null
cd ..
check "it is right's value" value_is 5
check "and staged" test -z "$(git ls-files -u)"
check "the record no longer lies beside it" test ! -e "$record"
check "a mind can be changed" vexel-merge-git resolve "$file" --theirs >/dev/null
check "it is left's value then" value_is 1
git commit -q -m settled
check "the record is gone with the commit" has_no_record
check "there is nothing to resolve again" refuses vexel-merge-git resolve "$file" 2>/dev/null
git reset -q --hard HEAD~

merge_darker && chmod 444 "$file" && mkdir .git/vexel-merge.lock
{ sleep 2 && rmdir .git/vexel-merge.lock; } &
check "a read-only file is settled" "${as_owner[@]}" vexel-merge-git resolve --left "$file" >/dev/null 2>"$work/err"
check "and stays read-only" test "$(stat -c %a "$file")" = 444
check "a lock that is waited for is named" grep -q '^waiting for .*/vexel-merge.lock: ' "$work/err"
git reset -q --hard

merge_darker
check "a pattern that fits nothing is an error" refuses vexel-merge-git resolve --left --path '*.Light.m_Range' "$file" 2>/dev/null
check "a pattern settles what it fits" vexel-merge-git resolve --left --path '*.Light.m_Intensity' "$file" >/dev/null
check "it is left's value" value_is 1
git reset -q --hard

merge_darker && sed -i '/^Conflict handling/d' "$record"
check "a record can be decided that has lost its heading" vexel-merge-git resolve --left "$file" >/dev/null
git reset -q --hard && merge_darker && echo mine >"$record"
check "without the record, the conflict can be settled" vexel-merge-git resolve --left "$file" >/dev/null
check "what stands in its place is left alone" test "$(cat "$record")" = mine
git reset -q --hard && rm "$record"

# Edited by hand since the merge: not to be lost, but to be added as it is.
merge_darker
scene 3 10 >"$file"
check "edits since the merge are not overwritten" vexel-merge-git resolve --left "$file" >/dev/null 2>&1
check "they are still there" value_is 3
git checkout -q -m -- "$file"
check "nor those made while the editor is open" refuses env GIT_EDITOR="sed -i s/2/3/ '$file' && sed -i 's/^# theirs.ours.base/left/'" \
  vexel-merge-git resolve "$file" 2>/dev/null
check "they are there, too" value_is 3
git add "$file"
check "adding the file removes the record" has_no_record
git reset -q --hard

merge_darker
check "the page of a conflict is made" vexel-merge-git report >"$work/pages"
check "it shows the conflict" grep -q 'data-kinds="[a-z ]*conflict' "$(cat "$work/pages")"
check "git mergetool merges with the record" env GIT_EDITOR="sed -i 's/^# theirs.ours.base/base/'" \
  git -c mergetool.keepBackup=false mergetool -y -t vexel >/dev/null 2>&1
check "it is base's value" value_is 2
git commit -q -m "Merge darker"
check "nothing is left of it" has_no_record
check "the page of a merge commit is made" vexel-merge-git report -o "$work/page.html" HEAD -- "$file" >/dev/null
check "it names the file" grep -qF "Main Scene.vexel" "$work/page.html"
check "it shows what was settled" grep -q '<td class="committed unchanged"><span class="value">2</span>' "$work/page.html"
scene 2 33 >"$file" && git commit -q -a --amend --no-edit && vexel-merge-git report -o "$work/page.html" HEAD >/dev/null
check "and what was edited by hand" grep -q '<span class="value">33</span></td><td class="state"><span>only committed' "$work/page.html"
check "a commit with one parent has no page" refuses vexel-merge-git report HEAD~ 2>/dev/null

# A file that nobody can read stays as ours has it, and in conflict.
git checkout -q -b broken start
printf '%%YAML 1.1\n--- !v!1 &1\nA: [\n' >"$file" && git commit -q -a -m broken
git checkout -q wider
check "what can't be read can't be merged" refuses git merge -q --no-edit broken >"$work/out" 2>"$work/err"
check "the error names the file" grep -qF "Cannot merge file '$file'" "$work/err"
check "ours is untouched" cmp -s "$file" <(scene 2 40)
check "there is no record of it" test ! -e "$record"
check "it is not committed as ours has it by chance" refuses git commit -q -a -m broken >/dev/null 2>&1
check "and its diff can be shown" grep -qF 'A: [' <(git diff start broken)
git reset -q --hard

# The repository's own rules: a light as one unit makes a conflict of the edits that have merged above.
printf '[exclusions]\nexclude *.Light\n' >"$work/rules" && cp "$work/rules" rules.txt && git config vexel.rules rules.txt
git checkout -q ":/^brighter"
check "the repository's own rules count" refuses git merge -q --no-edit wider >/dev/null 2>&1
check "and show in the page" grep -q 'data-kinds="[a-z ]*conflict' "$(vexel-merge-git report)"
git merge --abort && echo exclude >rules.txt
check "a mistake in them stops the merge" refuses git merge -q --no-edit wider >/dev/null 2>"$work/err"
check "its file is named" grep -q "line 1 .*rules.txt" "$work/err"
git merge --abort && git config --unset vexel.rules && rm rules.txt
git config vexel.typeInfo "$work/none.yaml"
check "a setting that can't be followed stops the merge" refuses git merge -q --no-edit wider >/dev/null 2>"$work/err"
check "its file is named" grep -qF none.yaml "$work/err"
git merge --abort && git config --unset vexel.typeInfo

# What bears our names but isn't in the engine's format is merged as git would do it.
git checkout -q -b plain wider
printf '%s\n' guid: 1 2 3 4 5 >A.meta && git add A.meta && git commit -q -m meta && git branch other
sed -i s/1/6/ A.meta && git commit -q -a -m first
git checkout -q other && sed -i s/5/7/ A.meta && git commit -q -a -m last
check "a file that is none of ours is merged as text" git merge -q --no-edit plain
check "with both edits" test "$(xargs <A.meta)" = "guid: 6 2 3 4 7"

# Two merges of the same branches that decided differently: their common ancestor can't be made, and no side may win.
for side in one two; do git checkout -q -b "$side" start && scene "${#side}" "$side" >New.vexel && git add . && git commit -q -m "$side"; done
for side in one two; do
  git checkout -q -b "kept-$side" "$side"
  git merge -q --no-edit "$([ "$side" = one ] && echo two || echo one)" >/dev/null 2>&1 || vexel-merge-git resolve --ours New.vexel >/dev/null
  git add . && git commit -q -m "kept $side"
done
check "two merges that differ don't merge silently" refuses git merge -q --no-edit kept-one >/dev/null 2>&1

# Without the program, as in a graphical client with a short PATH, nobody's edit is lost without a word.
git reset -q --hard && git checkout -q -b short ":/^brighter" && short=/usr/bin:/bin
check "without the program, the merge stops" refuses env PATH="$short" git merge -q --no-edit darker >/dev/null 2>"$work/err"
check "and says why in one line" test "$(grep -c 'vexel-merge-git is not found' "$work/err")" -eq 1
check "the file has conflict markers" grep -q '^<<<<<<< ours' "$file"
git merge --abort
# The same where it lies in its place, but can't be run.
touch "$work/no-program" && driver=$(git config merge.vexel.driver)
git config merge.vexel.driver "${driver//vexel-merge-git/$work/no-program}"
check "a program that can't be run is merged without, too" refuses git merge -q --no-edit darker >/dev/null 2>&1
check "with conflict markers" grep -q '^<<<<<<< ours' "$file"
git merge --abort && git config merge.vexel.driver "$driver"
git merge -q --no-edit darker >/dev/null 2>&1 || : > "$(ls .git/vexel-merge-records/*.path)"
check "a record without its text doesn't stay in the way" vexel-merge-git status >/dev/null
git merge --abort && rm -f "$record"
# Who only reads needs no name for the author of what git keeps.
git config user.useConfigOnly true && (unset GIT_AUTHOR_EMAIL GIT_COMMITTER_EMAIL EMAIL && vexel-merge-git enable >/dev/null)
check "diffs need no author" env -u GIT_AUTHOR_EMAIL -u GIT_COMMITTER_EMAIL git log -p -1 >/dev/null
git config --unset user.useConfigOnly
# What 1.0.1 has set works, and is brought up to date and taken back.
git reset -q --hard ":/^brighter" && git config merge.vexel.driver 'vexel-merge-git merge-driver %O %A %B %L %P'
git config -f .git/vexel-merge key.merge.vexel.driver.added 'vexel-merge-git merge-driver %O %A %B %L %P'
check "an old set-up is complete" vexel-merge-git status >/dev/null
check "and merges" git merge -q --no-edit wider
vexel-merge-git enable >/dev/null
check "enable brings it up to date" grep -qF 'command -v' <(git config merge.vexel.driver)
git log -p --all >/dev/null
check "git keeps what textconv prints" git rev-parse -q --verify refs/notes/textconv/vexel >/dev/null
check "an old set-up can be taken back" vexel-merge-git disable >/dev/null
check "with all of its settings" refuses git config merge.vexel.driver
check "with what git has kept" refuses git rev-parse -q --verify refs/notes/textconv/vexel
vexel-merge-git enable >/dev/null && git reset -q --hard

# Keys that are patterns, escapes or headers, or hold what ends a path, and file IDs that are equal as numbers: each
# choice is for its own place alone.
keys=('"*"' "'\\x2a'" "'\\x2a\\&'" '"a\nb"' "'a\\nb'" "'a\\x0ab'" speed '"speed x"' x.b '"Conflicts:"' '"\u202Eturned"')
commit_keys() { # commit_keys BRANCH VALUE SOLO
  git checkout -q -B "$1" start && scene 2 10 >"$file"
  printf "  %s: $2\n" "${keys[@]}" >>"$file" && printf '  x: {b: %s}\n  solo: %s\n' "$2" "$3" >>"$file"
  printf -- "--- !v!108 &612873651265321735%s\nLight:\n  m_Range: $2\n" 1 2 >>"$file" && git commit -q -a -m "$1"
}
git reset -q --hard && commit_keys keys 3 3 && git branch -f start && commit_keys keys-left 7 7 && commit_keys keys-right 8 3
git merge -q keys-left >/dev/null 2>&1 || mapfile -t lines < <(grep -n '^# theirs.ours.base' "$record" | cut -d : -f 1)
check "each place has a line" test ${#lines[@]} -eq $((${#keys[@]} + 3))
for line in "${lines[@]}"; do
  edit="sed -i -e '$line s/^# theirs.ours.base/left/' -e 's/^# theirs.ours.base/right/'"
  check "each line is read" env GIT_EDITOR="$edit" vexel-merge-git resolve "$file" >/dev/null
  check "line $line is for one place" test "$(grep -c ': 7}\?$' "$file")" -eq 2
  git hash-object "$file" >>"$work/results" && git checkout -q -m -- "$file" 2>/dev/null
done
check "and for no other line's" test "$(sort -u "$work/results" | wc -l)" -eq ${#lines[@]}
vexel-merge-git resolve --left --path '6128736512653217351.*.*' "$file" >/dev/null 2>&1 || :
check "a file ID is no number" test "$(grep -c '^# theirs.ours.base' "$record")" -eq $((${#lines[@]} - 1))
check "the rest is settled" vexel-merge-git resolve --right "$file" >/dev/null
check "what only one side edited stays" test "$(grep -c ': 7$' "$file")" -eq 2


# Patches, the second of which meets what has become of the first.
git reset -q --hard && git checkout -q darker && scene 1 50 >"$file" && git commit -q -a -m "and wider" && git format-patch -q -o "$work/patches" start
git checkout -q -B patched ":/^brighter"
check "a series of patches stops" refuses git am -q -3 "$work"/patches/* >/dev/null 2>&1
check "it is settled" vexel-merge-git resolve --theirs "$file" >/dev/null 2>"$work/err"
check "how to go on is said" grep -qFx 'To go on with the patches: git am --continue' "$work/err"
check "it goes on to its end" git am -q --continue >/dev/null 2>&1
check "with the choice and the second patch" cmp -s "$file" <(scene 1 50)
check "and without a trace" has_no_record

# A linked work tree has conflicts, records and a report of its own, and the hooks of the repository.
tree=$work/tree && git worktree add -q --detach "$tree" ":/^brighter"
check "a merge in a linked work tree stops" refuses git -C "$tree" merge -q darker >/dev/null 2>&1
check "with its record there alone" test -e "$tree/$record" -a ! -e "$record"
check "a commit of it is stopped" refuses git -C "$tree" commit -q -a -m early >/dev/null 2>&1
check "so is a check" refuses git -C "$tree" -c alias.check='!vexel-merge-git check' check >/dev/null 2>&1
check "the main one has no conflict" vexel-merge-git check
git checkout -q wider && scene 7 40 >"$file"
check "and can commit" git commit -q -a -m elsewhere
check "a merge there stops, too" refuses git merge -q darker >/dev/null 2>&1
(cd "$tree" && vexel-merge-git resolve --theirs "$file" >/dev/null 2>&1)
check "the one is settled" git -C "$tree" commit -q --no-edit
check "the other one is not" refuses git commit -q -a -m early >/dev/null 2>&1
check "and is, in its turn" vexel-merge-git resolve --ours "$file" >/dev/null 2>&1
git commit -q --no-edit
check "each has its choice" test "$(grep -h Intensity "$tree/$file" "$file" | tr -dc 0-9)" = 17
check "nothing is left" has_no_record
git -C "$tree" reset -q --hard HEAD~ && { git -C "$tree" merge -q darker >/dev/null 2>&1 || git worktree remove --force "$tree"; }
vexel-merge-git status >/dev/null
check "nor of a work tree that is gone" has_no_record

end_of_checks "git merges through vexel-merge-git"
