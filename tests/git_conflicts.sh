#!/usr/bin/env bash
# What people see of conflicts when git merges, and how these are settled, remembered and kept out of commits:
#   git_conflicts.sh PROGRAM
set -euo pipefail
# shellcheck source=tests/support/end_to_end.sh
source "$(dirname "${BASH_SOURCE[0]}")/support/end_to_end.sh"
export GIT_EDITOR=true

file=Harbour.vexel
guid=0123456789abcdef0123456789abcdef
# harbour INTENSITY RANGE SPEED BOAT: a lamp with a script, and a boat that a prefab brings.
harbour() {
  cat <<SCENE
%YAML 1.1
%TAG !v! tag:vexel.com,2011:
--- !v!1 &10
GameObject:
  m_Component:
  - component: {fileID: 11}
  - component: {fileID: 12}
  - component: {fileID: 13}
  m_Name: Lamp
--- !v!4 &11
Transform:
  m_GameObject: {fileID: 10}
  m_Children: []
  m_Father: {fileID: 0}
--- !v!108 &12
Light:
  m_GameObject: {fileID: 10}
  m_Intensity: $1
  m_Range: $2
--- !v!114 &13
MonoBehaviour:
  m_GameObject: {fileID: 10}
  m_Script: {fileID: 11500000, guid: $guid, type: 3}
  speed: $3
--- !v!1001 &20
PrefabInstance:
  m_Modification:
    m_TransformParent: {fileID: 0}
    m_Modifications:
    - target: {fileID: 401, guid: 00000000000000000000000000000001, type: 3}
      propertyPath: m_LocalPosition.x
      value: $4
      objectReference: {fileID: 0}
SCENE
}
commit() { # commit BRANCH START HARBOUR...
  git checkout -q -b "$1" "$2" && harbour "${@:3}" >"$file" && git commit -q -a -m "Work on $1"
}
says() { grep -qFx "$1" "$work/err"; }
is_at() { cmp -s "$file" <(harbour "$@"); }
has_nothing_of_ours() { [ ! -e .git/vexel-merge-records ] && ! grep -lq vexel-merge-git .git/hooks/*; }
stops() { refuses "$@" >"$work/out" 2>"$work/err"; }

git init -q -b main "$work/repository" && cd "$work/repository" && mkdir -p Code .git/hooks
vexel-merge-git enable >/dev/null
printf 'fileFormatVersion: 2\nguid: %s\n' "$guid" >Code/DoorOpener.cs.meta
harbour 2 10 1 1 >"$file" && git add -A && git commit -q -m base && git branch start
commit lights start 4 10 1 1
commit doors lights 4 10 2 2
commit bright start 9 10 1 1
commit all bright 9 20 3 3
git checkout -q --detach

check "a preview tells of conflicts" stops vexel-merge-git preview doors
check "and with whom" grep -qFx "  theirs, by Test: Lamp, PrefabInstance 20" "$work/out"
check "it writes nothing" test -z "$(git status --porcelain)$(find .git -name 'vexel-merge.*' -type d)"
check "a preview without conflicts is one" vexel-merge-git preview start >/dev/null

git checkout -q -b moved start && git mv "$file" Docks.vexel && git commit -q -m moved
check "a file that one side renames is merged" vexel-merge-git preview doors >"$work/out"
check "by its new name" grep -qFx "Docks.vexel: merges without conflicts" "$work/out"
check "as git does it" git merge -q --no-edit doors
check "such a merge has a page" vexel-merge-git report HEAD >"$work/pages"
check "scripts go by their classes there" grep -qF '<span class="class">DoorOpener</span>' "$(cat "$work/pages")"
check "sides by their branches" grep -qF '<title>Docks.vexel: doors merged into moved (' "$(cat "$work/pages")"
git commit -q --amend -m "Merge Ben's doors, and Ann's"
check "also where the message doesn't have them" grep -qF ': doors merged into moved (' "$(vexel-merge-git report HEAD)"
git checkout -q --detach all

check "a merge stops" stops git merge -q doors
check "scripts go by their classes" says "CONFLICT $file: Lamp > DoorOpener > speed: was 1, theirs (doors) 2, ours 3"
check "overrides by what they override" says \
  "CONFLICT $file: PrefabInstance 20 > m_LocalPosition.x of 401: was 1, theirs (doors) 2, ours 3"
check "the page has one row for it" test "$(grep -c '<tr data-path="PrefabInstance' "$(vexel-merge-git report)")" -eq 1
git add "$file" 2>"$work/err"
check "it is said that nothing is settled" grep -q "^warning: $file is staged with 3 conflicts" "$work/err"
touch new && git add new 2>"$work/err"
check "it is said once" test ! -s "$work/err"
check "the commit is stopped" stops git commit -q -m early
check "a check for scripts says so, too" stops vexel-merge-git check --staged
check "so does the status" grep -qx "not settled    $file" <(vexel-merge-git status)
check "a page shows it" vexel-merge-git report >/dev/null
check "one side's choice leaves the rest" stops vexel-merge-git resolve "$file" --theirs --path '*.Light.*'
check "which the other side gets" vexel-merge-git resolve --ours "$file" >/dev/null
check "a choice stays what it was" is_at 4 20 3 3
check "it can be changed until the commit" vexel-merge-git resolve --base --path 13.MonoBehaviour.speed "$file" >/dev/null
check "for that place alone" is_at 4 20 1 3
harbour 4 20 7 7 >"$file" && git add "$file"
check "what was edited since is not overwritten" vexel-merge-git resolve --ours "$file" >/dev/null 2>&1
check "it stays as it was edited" is_at 4 20 7 7
check "what is edited can be committed" git commit -q -m merged
check "nothing is left" has_nothing_of_ours
check "nothing is in conflict any more" stops vexel-merge-git resolve --force --theirs "$file"
check "and nothing was merged again" is_at 4 20 7 7
check "the commit has no conflict" vexel-merge-git check HEAD
git reset -q --hard all && git merge -q doors >/dev/null 2>&1 || git add "$file" 2>/dev/null
check "whoever insists can commit" git commit -q --no-verify -m careless
check "a build server finds it" stops vexel-merge-git check HEAD
check "nothing is left of that either" has_nothing_of_ours

# What somebody edits by hand is settled where that was, and nowhere else.
git reset -q --hard all && git merge -q doors >/dev/null 2>&1 || sed -i 's/m_Range: 20/m_Range: 20.0/; s/speed: 1/speed: 5/; s/$/\r/' "$file"
vexel-merge-git check >"$work/out" 2>&1 || :
check "one of three is settled by hand" test "$(grep -c ^CONFLICT "$work/out")" -eq 2
check "the others stop the commit" stops git commit -q -a -m early
check "they are counted" grep -q "^error: $file is staged with 2 conflicts that nobody has settled" "$work/err"
cp "$file" "$work/edited" && printf '%%YAML 1.1\n--- !v!1 &1\nA: [\n' >"$file"
check "what can't be read is still open" test "$(vexel-merge-git check 2>/dev/null | grep -c ^CONFLICT)" -eq 3
check "and not merged with a choice" stops vexel-merge-git resolve --theirs "$file"
cp "$work/edited" "$file" && git add "$file" 2>"$work/err"
check "and were when it was staged" grep -q "^warning: $file is staged with 2 conflicts" "$work/err"
check "a choice elsewhere leaves the edit" stops vexel-merge-git resolve --theirs --path '*.Light.*' "$file"
check "which is merged" test "$(grep -c 'speed: 5\|m_Intensity: 4' "$file")" -eq 2
check "a choice that meets the edit is refused" stops vexel-merge-git resolve --ours --path 13.MonoBehaviour.speed "$file"
check "it names both" grep -q "DoorOpener > speed: was 1, theirs (chosen now) 3, ours (edited) 5" "$work/err"
check "the rest can be meant to stay" vexel-merge-git resolve --as-is "$file" >/dev/null
check "then it can be committed" git commit -q -m by-hand
check "with the edit, the choice and what stood there" is_at 4 20.0 5 1
check "whose conflict a build server finds" stops vexel-merge-git check HEAD
git reset -q --hard all && git merge -q doors >/dev/null 2>&1 || vexel-merge-git resolve --force --base --path 13.MonoBehaviour.speed "$file" 2>/dev/null || :
check "an edit is merged with choices made before" vexel-merge-git resolve --theirs "$file" >/dev/null
sed -i 's/m_Range: 20/m_Range: 30/' "$file"
check "and with those made after it" vexel-merge-git resolve --ours --path '*.Light.*' "$file" >/dev/null
check "none is lost" is_at 9 30 1 2
# In a list, each element is a place: overrides of x, y and z, and of w, which both sides add. Ours has lost z.
override() { printf '    - target: {fileID: 401, guid: 00000000000000000000000000000001, type: 3}\n      propertyPath: m_LocalPosition.%s\n      value: %s\n      objectReference: {fileID: 0}\n' "$@"; }
git reset -q --hard && git checkout -q -b list start && { harbour 2 10 1 1 && override z 1 y 1; } >"$file" && git commit -q -a -m list
git checkout -q -b longer && { harbour 2 10 1 2 && override z 1 y 6 w 2; } >"$file" && git commit -q -a -m longer
git checkout -q list && { harbour 2 10 1 3 && override y 7 w 3; } >"$file" && git commit -q -a -m shorter
git merge -q longer >/dev/null 2>&1 || sed -i '/LocalPosition.y/{n; s/1/9/}' "$file"
vexel-merge-git check >"$work/out" 2>&1 || :
check "one override is settled, and two are not" test "$(sed -n 's/^CONFLICT.*ours //p' "$work/out" | xargs)" = "3 adds 3"

# A lamp that one side removes is compared with all of its parts.
git reset -q --hard && git checkout -q -b removed start && harbour 2 10 1 1 | sed '/&10$/,/speed/d' >"$file" && git commit -q -a -m removed
git merge -q bright >/dev/null 2>&1 || sed -i 's/value: 1/value: 8/' "$file"
check "an edit elsewhere doesn't settle it" stops git commit -q -a -m early
sed -i 's/m_Intensity: 2/m_Intensity: 3/' "$file"
check "an edit of its light does" git commit -q -a -m lit

# A file that both sides added can't be merged, and must not go with one side by chance.
for side in 1 2; do
  git checkout -q -b "added-$side" start && harbour 3 10 1 $side >New.vexel && git add New.vexel && git commit -q -m $side
done
check "two files of one name don't merge" stops git merge -q added-1
check "nor is ours committed without a word" stops git commit -q -a -m early
git add New.vexel
check "nor once it is staged" stops git commit -q -m early
check "a side can be taken" vexel-merge-git resolve --theirs New.vexel >/dev/null
check "it is theirs" cmp New.vexel <(harbour 3 10 1 1)
check "and another one" vexel-merge-git resolve --ours New.vexel >/dev/null
check "which can be committed" git commit -q -m ours
git checkout -q --detach all
git reset -q --hard all
printf '#!/bin/sh\nexit 0\n' >.git/hooks/pre-commit && chmod +x .git/hooks/pre-commit && cp .git/hooks/pre-commit "$work/own"
git merge -q doors >/dev/null 2>&1 || :
check "somebody's own hook stays" cmp .git/hooks/pre-commit "$work/own"
git merge --abort && git merge doors >/dev/null 2>"$work/err" || :
check "it is said that nothing stops a commit then, also the second time" grep -q '^warning: hooks of your own are in use (pre-commit)' "$work/err"
check "by the status as well" grep -q '^hooks .*(pre-commit)' <(vexel-merge-git status)
git merge --abort && rm .git/hooks/pre-commit
git merge -q doors >/dev/null 2>&1 || echo 'echo mine' >>.git/hooks/pre-commit
git merge --abort
check "what somebody adds to ours stays" test "$(cat .git/hooks/pre-commit)" = $'#!/bin/sh\necho mine'
rm .git/hooks/pre-commit

# Whatever becomes of a file that nobody has settled, it is not committed by chance.
pop() { # pop: the edits of "lights" come from a stash, and meet those of "bright"
  git reset -q --hard && git stash clear && git checkout -q --detach start && harbour 4 10 1 1 >"$file" && git stash -q
  git checkout -q --detach bright && { git stash pop -q >/dev/null 2>&1 || git add "$file" 2>/dev/null; }
}
again() { # again TEXT GIT-COMMAND...: after that, all is staged
  pop && "${@:2}" >/dev/null 2>&1 && git add "$file" 2>/dev/null
  check "it is stopped after $1" stops git commit -q -m early
}
pop && echo 1 >>new && git add new && git commit -q -m other -- new 2>/dev/null
check "it is stopped after a commit of something else" stops git commit -q -m early
again "another branch" git checkout -q -B other
again "it was unstaged" git restore --staged "$file"
again "a reset" git reset -q
again "a stash" eval 'git stash -q && git stash pop -q'
pop && git reset -q --hard && git stash clear && vexel-merge-git status >/dev/null
check "nothing of it is left" has_nothing_of_ours

# Patches ask another hook.
git checkout -q -B patch start && harbour 4 10 1 1 >"$file" && git commit -q -a -m patch
git rebase -q --apply bright >/dev/null 2>&1 || git add "$file" 2>/dev/null
check "a series of patches is stopped, too" stops git rebase --continue
git rebase --abort && git checkout -q --detach start && git branch -q -D patch other

# A file that both sides have renamed is remembered by its old name.
git checkout -q -B there lights && git mv "$file" there && git commit -q -m there
git checkout -q -B here bright && git mv "$file" here.vexel && git commit -q -m here
git merge -q there >/dev/null 2>&1 || git add -A 2>/dev/null
check "what has a new name on both sides is not committed undecided" stops git commit -q -m early
check "but as it stands" vexel-merge-git resolve --as-is here.vexel >/dev/null
check "can be committed" git commit -q -m renamed
git checkout -q --detach all && git branch -q -D here there

# Scenes are merged as scenes.
git checkout -q -b dark start && harbour 2 10 1 1 | sed '/&10$/,/speed/d' >"$file" && git commit -q -a -m dark
check "what one side removes and the other edits is asked" stops git merge -q bright
check "as one conflict, about the whole" says \
  "CONFLICT $file: Lamp: theirs (bright) edits m_Intensity of Light, ours removes it"
check "which is there until that is settled" is_at 2 10 1 1
check "theirs brings all of it" vexel-merge-git resolve --theirs "$file" >/dev/null
check "with their edit" is_at 9 10 1 1
git reset -q --hard && git config vexel.safe false
check "value by value, the removal wins" git merge -q --no-edit bright
git config --unset vexel.safe && harbour 2 10 1 1 | sed '/component: {fileID: 12}/d' >"$file" && git add "$file"
check "a broken scene is found when it is staged" stops vexel-merge-git check --staged
check "it says where" grep -q "^error: $file is broken: .*Lamp" "$work/err"
git commit -q -m broken
check "in its commit as well" stops vexel-merge-git check HEAD
git commit -q --allow-empty -m next
check "and not in the next one" vexel-merge-git check HEAD
git clone -q --depth 1 "file://$PWD" "$work/shallow" && cp "$file" Untracked.vexel
check "a file is looked at that nobody has added" stops vexel-merge-git check Untracked.vexel
check "one that isn't there is an error" stops vexel-merge-git check -- none.vexel
rm Untracked.vexel && cd "$work/shallow"
check "whoever lacks the history is told" stops vexel-merge-git check HEAD
cd "$work/repository"
git checkout -q --orphan first && git commit -q -m first
check "a first commit is looked at, too" stops vexel-merge-git check HEAD
git checkout -q --detach dark && git branch -q -D first

# More conflicts than anybody reads, in two lamps of one name.
git checkout -q -b many start && printf '  key%02d: 1\n' {1..12} >keys
lamps() { harbour 2 10 1 1 && sed "s/: 1/: $1/" keys && printf -- '--- !v!1 &30\nGameObject:\n  m_Name: Lamp\n  m_Layer: %s\n' "$1"; }
for value in 1 2 3; do
  lamps "$value" | sed "s/m_Name: Lamp/&\n  m_Layer: $value/" >"$file" && git commit -q -a -m "$value" && git tag "v$value"
  git checkout -q -B many v1
done
git checkout -q v3
check "a merge of many conflicts stops" stops git merge -q v2
check "ten are shown" test "$(grep -c "^CONFLICT $file" "$work/err")" -eq 10
check "the rest is counted" grep -q "^\.\.\. and [0-9]* more: vexel-merge-git check '$file'$" "$work/err"
check "the command shows all" stops vexel-merge-git check "$file"
check "lamps of one name are told apart" test "$(grep -c 'Lamp > m_Layer ([13]0.GameObject.m_Layer): ' "$work/out")" -eq 2
git merge --abort

# What somebody writes into the record.
cat >"$work/editor" <<'EDITOR'
sed -i 's/^# theirs.ours.base 12/ours 12/; s/^# theirs.ours.base 13/# ours 13/' "$1"
printf '%s\n' 'theirs 12.Light.m_Intensity' 'ours 13.MonoBehavior.speed' >>"$1"
EDITOR
git checkout -q all && { git merge -q doors >/dev/null 2>&1 || :; }
check "what has no line is still open" stops env GIT_EDITOR="sh '$work/editor'" vexel-merge-git resolve "$file"
check "of two lines for a place the last one counts" is_at 4 20 1 1
check "a path that is nowhere is named" says \
  "Warning: the choice for '13.MonoBehavior.speed' matches nothing; did you mean '13.MonoBehaviour.speed'?"
check "and goes" refuses grep -q MonoBehavior.speed "$file.vexel-conflicts"
check "so is a choice that is a comment" says "Warning: '# ours 13.MonoBehaviour.speed' chooses nothing: take the \"#\" off"
check "a place has the name that its line has" stops vexel-merge-git resolve --theirs --path "Lamp > DoorOpener > speed" "$file"
check "or that of its object" stops vexel-merge-git resolve --ours --path Lamp "$file"
check "which settles all of that" is_at 9 20 3 1
check "a name that is nowhere is an error" stops vexel-merge-git resolve --ours --path PrefabInstnace "$file"
check "which names the nearest one" says "error: no conflict in $file fits 'PrefabInstnace'; did you mean 'PrefabInstance 20'?"
check "also for a part of one" stops vexel-merge-git resolve --ours --path Opener "$file"
check "with all of it" says "error: no conflict in $file fits 'Opener'; did you mean 'Lamp > DoorOpener'?"
check "what is far from everything is an error" stops vexel-merge-git resolve --ours --path Lighthouse "$file"
check "which says what there is" says \
  "error: no conflict in $file fits 'Lighthouse'; in conflict: PrefabInstance 20 > m_LocalPosition.x of 401, Lamp > DoorOpener > speed, Lamp > Light > m_Intensity"
git merge --abort

# Lines about a vector, and about what base lacks.
door() { harbour 2 10 1 1 | sed "s/  speed: 1/&\n  offset: {x: $1, y: $2}${3:+\n  tint: $3}/" >"$file" && git commit -q -a -m door; }
git checkout -q -b door start && door 0 0 && git checkout -q -b wide && door 2 0 4 && git checkout -q door && door 0 3 5
check "a merge with both stops" stops git merge -q wide
check "the line has the components" says "CONFLICT $file: Lamp > DoorOpener > offset: was {x: 0, y: 0}, theirs (wide) x 2, ours y 3"
check "it says that base has none" says \
  "CONFLICT $file: Lamp > DoorOpener > tint: was nothing (theirs stands until settled), theirs (wide) adds 4, ours adds 5"
vexel-merge-git resolve --base "$file" >/dev/null 2>"$work/err"
check "who wants base's is told what it gets" says "Warning: base has nothing at Lamp > DoorOpener > tint, so theirs stands there"
git reset -q --hard

# In a rebase, "theirs" are one's own commits.
git checkout -q doors && git branch a-namesake all
check "a rebase stops" stops git rebase -q all
check "it says whose is whose" says \
  "CONFLICT $file: Lamp > Light > m_Intensity: was 2, theirs (\"Work on lights\" of doors, which is rebased) 4, ours (all, its new base) 9"
check "so does the page" grep -qF 'Ours (all, its new base)' "$(vexel-merge-git report)"
git add "$file" 2>/dev/null
check "it doesn't go on undecided" stops git rebase --continue
git config rerere.enabled true
check "a choice is made" env GIT_LITERAL_PATHSPECS=1 vexel-merge-git resolve --ours "$file" >/dev/null
check "the rebase stops at the next commit" stops git rebase --continue
git rebase --abort
check "an aborted rebase leaves nothing" has_nothing_of_ours
check "the rebase stops again" stops git rebase -q all
check "what was decided is remembered" says "1 conflict of $file settled as before"
check "it is there" is_at 9 20 3 3
git add "$file"
check "the rebase goes on to the next commit" stops git rebase --continue
check "only what is new is asked" test "$(grep -c '^CONFLICT Harbour' "$work/err")" -eq 2
git rebase --abort
find .git/vexel-merge-decisions -type f -exec touch -d '61 days ago' {} +
git rebase -q all >/dev/null 2>&1 || vexel-merge-git resolve --theirs "$file" >/dev/null
check "what is old is forgotten" test -z "$(find .git/vexel-merge-decisions -mtime +60)"
git rebase --abort && git config --unset rerere.enabled

# What is picked where a rebase stops, or comes back at its end, isn't what is rebased.
commit swift start 2 10 5 1
git checkout -q -b slow start && harbour 2 40 1 1 >"$file" && git commit -q -a -m range
GIT_SEQUENCE_EDITOR="sed -i s/^pick/edit/" git rebase -q -i swift 2>/dev/null
git cherry-pick doors~ >/dev/null 2>&1 && check "a pick in the middle stops" stops git cherry-pick bright
check "its line doesn't name the rebase" grep -qF 'm_Intensity: was 2, theirs 9, ours 4' "$work/err"
git cherry-pick --abort && git rebase --abort && harbour 2 40 8 1 >"$file"
git rebase -q --autostash swift >/dev/null 2>&1
check "nor does the record of what was stashed" grep -q 'speed: was 1, theirs 8, ours 5$' "$file.vexel-conflicts"
git reset -q --hard && git stash drop -q

git checkout -q all
check "a series of picks stops" stops git cherry-pick start..doors
check "it names the commit" grep -qF 'theirs ("Work on lights") 4, ours 9' "$work/err"
git cherry-pick --abort
harbour 3 20 3 3 >"$file" && git stash -q && harbour 5 20 3 3 >"$file" && git commit -q -a -m five
check "a revert stops" stops git revert --no-edit bright
check "it has both edits in its lines" grep -qF 'm_Intensity: was 9, theirs 2, ours 5' "$work/err"
git revert --abort
check "a stash stops" stops git stash pop
check "it has both edits in its lines, too" grep -qF 'm_Intensity: was 9, theirs 3, ours 5' "$work/err"
git reset -q --hard

# Two people settle the same conflicts otherwise, and then merge with one another.
git checkout -q -b calm all && { git merge -q doors >/dev/null 2>&1 || vexel-merge-git resolve --base "$file" >/dev/null; }
git commit -q -m calm && git checkout -q -b busy doors && { git merge -q all >/dev/null 2>&1 || vexel-merge-git resolve --ours "$file" >/dev/null; }
git commit -q -m busy
check "nobody's decision is overruled" stops git merge -q calm
check "it is said that there is nothing to go by" says "CONFLICT $file: Lamp > Light > m_Intensity: was 2 (undecided), theirs (calm) 2, ours 4"
check "of overrides, too" says \
  "CONFLICT $file: PrefabInstance 20 > m_LocalPosition.x of 401: was 1 (undecided), theirs (calm) 1, ours 2"
check "base stands until that is settled" is_at 2 20 1 1
check "the page shows as much" test "$(grep -c '<td class="base[^>]*><span class="value">[12](undecided)' "$(vexel-merge-git report)")" -eq 3
check "the one side can be taken" vexel-merge-git resolve --ours "$file" >/dev/null
check "as it was" is_at 4 20 2 2
check "and base" vexel-merge-git resolve --base "$file" >/dev/null
check "without a trace" is_at 2 20 1 1
git reset -q --hard && git checkout -q -b unlit start && harbour 2 10 1 1 | sed '/&10$/,/speed/d' >"$file" && git commit -q -a -m unlit
git checkout -q -b kept && { git merge -q bright >/dev/null 2>&1 || vexel-merge-git resolve --base "$file" >/dev/null; }
git commit -q -m kept && git checkout -q -b gone bright && { git merge -q unlit >/dev/null 2>&1 || vexel-merge-git resolve --theirs "$file" >/dev/null; }
git commit -q -m gone
check "nor is what somebody has kept removed" stops git merge -q kept
check "the lamp is there" is_at 2 10 1 1
check "and can go" vexel-merge-git resolve --ours "$file" >/dev/null
check "with all of it" refuses grep -q Lamp "$file"
# tree FATHER: a buoy below one of three piers, or at the top.
tree() {
  printf '%%YAML 1.1\n%%TAG !v! tag:vexel.com,2011:\n'
  for node in 11 21 31 41; do
    printf -- '--- !v!1 &%s\nGameObject:\n  m_Component:\n  - component: {fileID: %s}\n  m_Name: N%s\n' $((node - 1)) $node $node
    printf -- '--- !v!4 &%s\nTransform:\n  m_GameObject: {fileID: %s}\n  m_Children: ' $node $((node - 1))
    if [ "$node" = "$1" ]; then printf '\n  - {fileID: 41}\n'; else echo '[]'; fi
    printf '  m_Father: {fileID: %s}\n' $((node == 41 ? $1 : 0))
  done
}
# moves MINE THEIRS: both move it from 11; one then settles that with base's father, the other with their own.
moves() {
  git reset -q --hard && git checkout -q -B tree start && tree 11 >"$file" && git commit -q -a -m tree
  git checkout -q -B mine && tree "$1" >"$file" && git commit -q -a -m mine && git branch -f my-move
  git checkout -q -B other tree && tree "$2" >"$file" && git commit -q -a -m other && git branch -f other-move
  { git merge -q my-move >/dev/null 2>&1 || vexel-merge-git resolve --ours "$file" >/dev/null; } && git commit -q -m other
  git checkout -q mine
  { git merge -q other-move >/dev/null 2>&1 || vexel-merge-git resolve --base "$file" >/dev/null; } && git commit -q -m mine
  stops git merge -q other
}
for fathers in "21 31" "0 21" "21 0"; do
  check "a move from where it is kept is asked" moves $fathers
  check "as one conflict" test "$(grep -c "^CONFLICT $file: N41 > Transform > m_Father: was undecided" "$work/err")" -eq 1
  check "what stands meanwhile is sound" refuses grep -q undecided "$file"
  check "one side's move can be taken" vexel-merge-git resolve --theirs "$file" >/dev/null
  check "it is theirs" test "$(tail -1 "$file")" = "  m_Father: {fileID: ${fathers#* }}"
  check "in a sound scene" vexel-merge-git check --staged
  check "and taken back" vexel-merge-git resolve --ours "$file" >/dev/null
  check "for ours" test "$(tail -1 "$file")" = "  m_Father: {fileID: 11}"
  check "in a sound scene, too" vexel-merge-git check --staged
done
git reset -q --hard && git config rerere.enabled true
# unlit_at SPEED: one side removes the lamp, the other edits it, while its script was edited before.
unlit_at() {
  git checkout -q -B faster start && harbour 2 10 "$1" 1 >"$file" && git commit -q --allow-empty -a -m faster
  git checkout -q -B unlit && harbour 2 10 1 1 | sed '/&10$/,/speed/d' >"$file" && git commit -q -a -m unlit
  git checkout -q -B bright faster && harbour 9 10 "$1" 1 >"$file" && git commit -q -a -m bright
  stops git merge -q unlit
}
unlit_at 1 && vexel-merge-git resolve --theirs "$file" >/dev/null && git reset -q --hard
check "the same removal is remembered" unlit_at 1
check "as it was settled" says "1 conflict of $file settled as before"
git reset -q --hard
check "that of a lamp which was another one is not" unlit_at 7
check "but is asked" refuses grep -q 'settled as before' "$work/err"

git reset -q --hard && vexel-merge-git disable >"$work/out"
check "whoever gives up is told of the attributes" grep -q '^.gitattributes is tracked, and has gone: ' "$work/out"

end_of_checks "people settle conflicts"
