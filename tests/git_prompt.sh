#!/usr/bin/env bash
# Settles conflicts conflict by conflict, with answers from a pipe and from a terminal:
#   git_prompt.sh PROGRAM
set -euo pipefail
# shellcheck source=tests/support/end_to_end.sh
source "$(dirname "${BASH_SOURCE[0]}")/support/end_to_end.sh"

file=Harbour.vexel
# lamps X.RANGE X.INTENSITY Y.RANGE: two lamps, of which the second one's values are on neighbouring lines.
lamps() {
  scene 1 "$1"
  scene "$2" "$3" | sed '1,2d; s/&1/\&2/; s/fileID: 1/fileID: 2/; s/Lamp/Lantern/'
}
commit() { # commit BRANCH LINES...
  git checkout -q -B "$1" main && "${@:2}" >"$file" && git commit -q -a -m "$1"
}
# answer ANSWERS ARGUMENT...: each letter of the answers is one.
answer() { sed 's/./&\n/g' <<<"$1" | vexel-merge-git resolve -p "${@:2}" >"$work/out" 2>"$work/err"; }
asked() { grep -c '^  theirs' "$work/out"; }
is_at() { cmp -s "$file" <(lamps "$@"); }
is_open() { [ "$(git ls-files -u | wc -l)" -eq 3 ]; }
again() { git reset -q --hard && ! git merge -q theirs >/dev/null 2>&1; }

git init -q -b main "$work/repository" && cd "$work/repository" && vexel-merge-git enable >/dev/null
lamps 1 1 1 >"$file" && git add -A && git commit -q -m base
commit theirs lamps 2 2 2
commit ours lamps 3 3 3

check "there is nothing to ask without a conflict" refuses answer t
again
cp "$file" "$work/undecided"
check "who only skips decides nothing" refuses answer sssx
check "which is said" grep -qFx "Nothing is settled in $file" "$work/err"
check "nor who quits" refuses answer q
next="vexel-merge-git resolve"
check "who is told how to go on" grep -qFx "To settle what is left, in $file: $next" "$work/err"
check "by the status, too" grep -qFx "next           $next, to settle what is left, in $file" <(vexel-merge-git status)
check "nor who says nothing" refuses answer ''
check "the file is as it was" cmp "$file" "$work/undecided"
check "in conflict" is_open
check "the letter for a whole object does for its only conflict, too" answer TT
again
check "an answer that is none is asked for again, with help" refuses answer 'xtq'
check "the question stays" test "$(asked)" -eq 2 -a "$(grep -c '^q - quit' "$work/out")" -eq 1
check "what was settled is kept" is_at 2 1 1
check "the rest is open" is_open
check "and asked about alone" answer To
check "in one question for the whole object" test "$(asked)" -eq 1
check "the answers stand" is_at 2 2 2
check "the file is staged" test -z "$(git ls-files -u)"
check "how to go on is said" grep -qFx 'To finish the merge: git commit' "$work/err"
check "and again, without a file" vexel-merge-git resolve 2>"$work/err"
check "with what was settled" test "$(sed 's/.*: //' "$work/err" | xargs)" = "$file vexel-merge-git resolve $file git commit"
check "a mind can be changed before the commit" answer sosq
check "knowing what it was" grep -qFx '  now     theirs' "$work/out"
check "for one place alone" is_at 2 3 2
check "who quits then changes nothing" answer sq
check "and is told that nothing is left" grep -q "Resolved $file$" "$work/out"
check "it is still staged" is_at 2 3 2

# How to go on is another command in each of these.
for operation in rebase cherry-pick 'revert --no-edit'; do
  git reset -q --hard && git checkout -q --detach ours
  # shellcheck disable=SC2086
  check "a ${operation%% *} stops" refuses git $operation theirs >/dev/null 2>&1
  check "it is settled" answer ttt
  [ "$operation" = rebase ] || check "who theirs is, by the subject" grep -q '; theirs is \(without \)\?"theirs"$' "$work/out"
  check "how to go on with it is said" grep -qx "To go on with the .*: git ${operation%% *} --continue" "$work/err"
  check "it goes on" env GIT_EDITOR=true git "${operation%% *}" --continue >/dev/null 2>&1
  check "to its end" refuses git "${operation%% *}" --abort >/dev/null 2>&1
done
git checkout -q ours && lamps 5 5 5 >"$file" && git stash -q && git checkout -q theirs
check "what was stashed comes into conflict" refuses git stash pop >/dev/null 2>&1
check "it is settled, too" answer ttt
check "and nothing is left to do" refuses grep -q '^To ' "$work/err"
git reset -q --hard && git stash drop -q && git checkout -q ours

again
check "without a terminal, somebody is told to say how to settle it" refuses vexel-merge-git resolve 2>"$work/err"
check "in words" grep -q 'nobody can be asked without a terminal' "$work/err"
check "nobody goes back from the first one" refuses answer kq
check "nor needs the whole help for that" grep -qF 'This is the first one: there is none before.' "$work/out"
check "answers can be taken back" answer tkotkB
check "the last one counts" is_at 3 1 1
again
harbour=$(vexel-merge-git resolve -p --color=always <<<q 2>/dev/null || :)
check "colours can be had in a pipe" grep -qF $'\e[35m  theirs  2\e[m' <<<"$harbour"
scene 7 7 >"$file"
check "edits since the merge are not overwritten" answer ttt
check "nor asked about" test ! -s "$work/out" -o "$(asked)" -eq 0
check "they are there" cmp -s "$file" <(scene 7 7)
again
lamps 7 1 1 >"$file"
check "the rest is asked about" answer to
check "and merged with them" is_at 7 2 3
again
again
lamps 7 1 1 >"$file"
check "base's value is a choice, too, that an edit doesn't go with" \
  grep -q "m_Range was edited by hand" <(vexel-merge-git resolve --base --path 11.Light.m_Range "$file" 2>&1)
check "the edit stays" is_at 7 1 1
mkfifo "$work/answers"
vexel-merge-git resolve -p <"$work/answers" >"$work/out" 2>"$work/err" &
{
  echo t
  for _ in {1..400}; do ! grep -q Lantern "$work/out" || break && sleep 0.05; done
  scene 7 7 >"$file" && echo T
} >"$work/answers"
check "nor are those made while it asks" refuses wait $!
check "they are there" cmp -s "$file" <(scene 7 7)

# In a terminal, without options, the prompt is the first choice. Several files come one after the other.
git reset -q --hard && git checkout -q main && cp "$file" Other.vexel && git add -A && git commit -q -m other
for side in theirs ours; do
  commit "$side" lamps "${#side}" "${#side}" "${#side}" && cp "$file" Other.vexel && git commit -q -a -m other
done
again
terminal() { script -qec "$1" /dev/null 2>&1 | tr -d '\r'; }
printf '%s\n' p t t t o q | NO_COLOR=1 TERM=xterm terminal "vexel-merge-git resolve" >"$work/out" || :
check "the terminal asks" grep -q '^Settle here, conflict by conflict (p), .*(3/3) \|^(3/3) Lantern' "$work/out"
check "without colours where they aren't wanted" refuses grep -q $'\e' "$work/out"
check "the first file is done" is_at 6 6 6
check "and staged; the other one is left" test "$(git ls-files -u | cut -f 2 | uniq)" = Other.vexel
check "with what was settled in it" cmp -s Other.vexel <(lamps 4 1 1)
TERM=xterm terminal "vexel-merge-git resolve -p" <<<q >"$work/out" || :
check "colours are the rule" grep -qF $'\e[36m  ours    4' "$work/out"
check "a new commit stops" refuses git commit -q -m undecided >/dev/null 2>&1

# Git puts the file back where its tool leaves something: what was chosen counts only for the next try.
again
printf '%s\n' t q q q | NO_COLOR=1 TERM=xterm terminal "env -u DISPLAY -u WAYLAND_DISPLAY git mergetool -y $file" >"$work/out" || :
check "the merge tool asks" grep -q 'm_Range' "$work/out"
git checkout -q --theirs Other.vexel && git add Other.vexel
sed 's/m_Intensity: 1/m_Intensity: 8/; /^--- !v!108 &2/,$s/m_Range: 1/m_Range: 8/' "$file" >"$work/edited" || :
cp "$work/edited" "$file" && git add "$file"
check "what it was told isn't in the file" grep -q 'm_Range: 1' "$file"
check "and doesn't count as settled" refuses git commit -q --no-edit 2>/dev/null


# A choice that brings up another conflict: each side has moved one object, and both at once are a circle.
# objects PARENT...: of objects 1 to 3, 0 for none.
objects() {
  printf '%%YAML 1.1\n%%TAG !v! tag:vexel.com,2011:\n'
  for i in 1 2 3; do
    printf -- '--- !v!1 &%s0\nGameObject:\n  m_Component:\n  - component: {fileID: %s1}\n  m_Name: Object %s\n' "$i" "$i" "$i"
    printf -- '--- !v!4 &%s1\nTransform:\n  m_GameObject: {fileID: %s0}\n  m_Father: {fileID: %s}\n' "$i" "$i" "${!i}"
  done
}
git reset -q --hard && git checkout -q main && objects 0 0 0 >"$file" && git commit -q -a -m objects
commit theirs objects 21 0 0
commit ours objects 31 11 0
again
check "a choice brings up another question" answer tktob
check "which is asked again after an answer that contradicts the first one" \
  grep -q '  not settled by that: Object 2 > Transform > m_Father$' "$work/out"
check "it is announced" grep -q '^  open now: Object 2 > Transform > m_Father$' <(sed 's/.*? //' "$work/out")
check "it says where to" grep -qFx '  ours    moves it below Object 3' "$work/out"
git reset -q --hard && commit theirs objects 21 31 0 && commit ours objects 0 0 11
again
check "who moved others into a circle is said to" refuses answer q
check "by their names" grep -qFx '  ours    moves Object 3 below Object 1' "$work/out"

# Lists and references, by the names of what they lead to: one side removes a list that the other one reorders.
# wall GUID TARGET...
wall() {
  objects 0 0 0
  printf -- '--- !v!114 &40\nMonoBehaviour:\n  m_Material: {fileID: 2, guid: %032d, type: 2}\n  m_Wall: 1\n' "$1"
  [ $# -eq 1 ] || { echo '  m_Targets:' && printf '  - {fileID: %s}\n' "${@:2}"; }
}
git reset -q --hard && git checkout -q main && wall 1 10 21 30 >"$file"
for guid in 1 2 3; do printf 'fileFormatVersion: 2\nguid: %032d\n' "$guid" >"Brick$guid.mat.meta"; done
git add -A && git commit -q -m wall
commit theirs wall 2
commit ours wall 3 10 30 21
again
check "a list is asked about" refuses answer ss
check "by its elements' names" grep -qFx '  was     [Object 1, Object 2, Object 3]' "$work/out"
check "so that orders differ" grep -qFx '  ours    new order: …, Object 3, Object 2' "$work/out"
check "another asset goes by its file" grep -qFx '  theirs  Brick2.mat' "$work/out"

# A long list: what differs is shown, and where; a thing in two slots is one thing.
bricks() {
  objects 0 0 0
  printf -- '--- !v!23 &40\nMeshRenderer:\n  m_Materials:\n'
  printf -- '  - {fileID: 2, guid: %032d, type: 2}\n' "$@"
}
git reset -q --hard && git checkout -q main && bricks 1 2 3 4 5 6 7 8 9 8 >"$file"
for guid in 4 5 6 7 8 9; do printf 'fileFormatVersion: 2\nguid: %032d\n' "$guid" >"Brick$guid.mat.meta"; done
git add -A && git commit -q -m bricks
commit theirs bricks 1 4 2 3 1 1 1 1 5 6 7 8 9 8
commit ours bricks 1 3 4 5 6 7 8 2 9 8
again
check "a long list is asked about" refuses answer q
check "by what was touched" grep -qFx '  was     […, Brick2.mat, Brick3.mat, Brick4.mat, Brick5.mat, …]' "$work/out"
check "with its new order behind what is new" grep -qFx \
  '  theirs  adds Brick1.mat, adds Brick1.mat, adds Brick1.mat, adds 1 more, new order: Brick1.mat, Brick4.mat, Brick2.mat, …' \
  "$work/out"
check "as far as it is one" grep -qFx '  ours    new order: …, Brick8.mat, Brick2.mat, Brick9.mat, …' "$work/out"

end_of_checks "people are asked"
