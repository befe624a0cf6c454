#!/usr/bin/env bash
# Works in a repository whose author means harm: tracked links under the names of our files, names that are options,
# commands or patterns, keys that look like records. Nothing outside of it may change.
#   git_hostile.sh PROGRAM
set -euo pipefail
# shellcheck source=tests/support/end_to_end.sh
source "$(dirname "${BASH_SOURCE[0]}")/support/end_to_end.sh"
export GIT_EDITOR=true

long="$(printf 'n%.0s' {1..230}).vexel"
inside=file.vexel.html/x.vexel
odd=("$inside" '-$(touch pwned).vexel' $'folder\n/last\n.vexel\n' '*.vexel' $'\e[31mred \u9b.vexel' "$long" 'a=%P "\101.vexel')
guarded=(link.vexel file.vexel folder.vexel)
# What outside looks like, and what is tracked beside the assets.
outside() { (cd "$work" && find outside repository -ls | awk '{$1 = ""; print}' && find outside repository -type f -exec cat {} +); }
untouched() { check "nothing outside is touched: $1" cmp <(outside) "$work/before"; }
is_clean() { [ -z "$(git status --porcelain --ignored)" ]; }
# all_scenes INTENSITY: with a key that tries to be a record.
all_scenes() {
  for name in "${guarded[@]}" "${odd[@]}" dir/x.vexel; do
    { scene "$1" 10; printf '  "\\nConflict handling:\\nleft *.Light.*\\n#": %s\n' "$1"; } >"./$name"
  done
}

# Another repository is where a command's output, which loses the line breaks at its end, would lead to.
git init -q "$work/repository" && mkdir "$work/outside" "$work/repository"$'\n' && cd "$work/repository"$'\n'
mkdir "$work/outside/dir" && echo mine | tee "$work"/outside/{attributes,record,asset,edited,page,own} >/dev/null
git init -q -b main && mkdir $'folder\n' dir "${inside%/*}"
ln -s ../outside/attributes .gitattributes.vexel-new
ln -s ../outside/page report.html && ln -s ../outside folder.link
for name in "${guarded[@]}"; do
  ln -s ../outside/record "$name.vexel-conflicts.new"
  ln -s ../outside/asset "$name.vexel-new"
  ln -s ../outside/edited "$name.vexel-edited"
done
ln -s ../outside/own link.vexel.vexel-conflicts
printf 'Conflict handling:\nleft *.*.*\n' >file.vexel.vexel-conflicts
mkdir folder.vexel.vexel-conflicts && echo mine >folder.vexel.vexel-conflicts/file
outside >"$work/before"
vexel-merge-git enable --patterns '*.vexel *.vexel? [-$]*' >/dev/null
printf '%s\n' '*.vexel* merge=vexel' '*.vexel-* !merge' 'folder?/* merge=vexel' >>.gitattributes
untouched enable
all_scenes 2 && git add -A -f && git commit -q -m base && git branch start
all_scenes 5 && git commit -q -a -m right && git branch right
git checkout -q -b left start && printf 'Conflict handling:\nright *.*.*\n' >dir/x.vexel.vexel-conflicts
git add -f dir && all_scenes 1 && git commit -q -a -m left && git checkout -q right
number=$((${#guarded[@]} + ${#odd[@]} + 1))
conflicts() { git ls-files -u -z | tr '\0\n' '\n ' | cut -f 2 | sort -u | wc -l; }

check "the merge stops" refuses git merge -q left >/dev/null 2>"$work/err"
untouched merge
check "each scene is in conflict" test "$(conflicts)" -eq "$number"
check "each conflict has a record" test "$(grep -c ', listed in ' "$work/err")" -eq "$number"
check "a record of theirs is none" refuses grep -qF 'dir/x.vexel.vexel-conflicts; to settle' "$work/err"
check "no other file has changed" refuses grep -qv '^UU\|^A  dir/' <(git status --porcelain)
call=$(LC_ALL=C sed -n "s/.*to settle: \(.*red .*\)/\1/p" "$work/err")
check "the advised command names its file in plain letters" grep -qF "left in ${odd[4]}" <(bash -c "${call//[^ -~]/}" 2>&1)
vexel-merge-git resolve . >/dev/null 2>"$work/err" || :
check "a record that nobody has edited settles nothing" test "$(conflicts)" -eq "$number"
check "pages are made" vexel-merge-git report -- "$long" file.vexel "$inside" >/dev/null
check "each page has a place, whatever the others are called" test "$(find .git/vexel-merge-report -type f ! -name index.html | wc -l)" -eq 3
check "and the index says of each what happened" test "$(grep -c '</a></th>\(<td class="number">[0-9]*</td>\)\{4\}' .git/vexel-merge-report/index.html)" -eq 3
check "with a link" test "$(grep -c '<a href="[^"<>]*.html">[^<]*</a>' .git/vexel-merge-report/index.html)" -eq 3
rm -r .git/vexel-merge-report && vexel-merge-git report -- "$inside" >/dev/null
check "also where a folder came first" vexel-merge-git report -- file.vexel >/dev/null
for link in report.html dir/../report.html folder.link/page; do
  check "no page goes through $link" refuses vexel-merge-git report -o "$link" -- file.vexel 2>/dev/null
done
untouched "resolve and report"
check "no default page goes through a link" refuses vexel-merge-report link.vexel link.vexel link.vexel 2>"$work/err"
check "the page's name is said" grep -qF report.html "$work/err"
untouched "a default page"
git -c mergetool.keepBackup=false mergetool -y -t vexel file.vexel >/dev/null 2>&1 || :
check "a terminal gets no control characters" refuses grep -q $'\e\[31m' \
  <(script -qec "echo e | vexel-merge-git resolve '${odd[4]}'; vexel-merge-git resolve -p --color=always '${odd[4]}'; vexel-merge-git status" /dev/null)

mv dir "$work/dir" && ln -s ../outside/dir dir && cp "$work/dir/x.vexel" "$work/outside/dir" && outside >"$work/before"
check "what lies behind a link is refused" refuses vexel-merge-git resolve --left --force dir/x.vexel 2>/dev/null
untouched "a folder that became a link"
rm dir && mv "$work/dir" dir
vexel-merge-git resolve --left . >/dev/null 2>"$work/err" || :
for name in "${guarded[@]}" "${odd[@]}"; do
  check "$name has left's value" grep -qFx '  m_Intensity: 1' "./$name"
done
git merge --abort
check "an aborted merge leaves nothing" is_clean
check "no list and no hook either" test ! -e .git/vexel-merge-records -a ! -e .git/hooks/post-index-change
git cherry-pick left >/dev/null 2>&1 || vexel-merge-git status >"$work/out"
check "nor is one of theirs that git brings last" grep -q '^  its record is .git/' <(grep -A 1 dir/x.vexel "$work/out")
GIT_EDITOR="sed -i 's/^# theirs.ours.base/theirs/'" vexel-merge-git resolve dir/x.vexel >/dev/null 2>&1 || :
check "the record that is ours counts" grep -qFx '  m_Intensity: 1' dir/x.vexel
cp -R .git/vexel-merge-records "$work" && git cherry-pick --abort
cp -R "$work/vexel-merge-records" .git && touch .git/index.lock && vexel-merge-git status >/dev/null
check "while git is at work, no record goes" test -e .git/vexel-merge-records
rm .git/index.lock && vexel-merge-git status >/dev/null
check "and then all do" test ! -e .git/vexel-merge-records
untouched "all of it"

# Two work trees at once: the hook must not go with the last record of one while the other one gets its first.
git checkout -q -b one start && scene 1 10 >file.vexel && git commit -q -a -m one
git checkout -q -b two start && scene 5 10 >file.vexel && git commit -q -a -m two
git worktree add -q --detach "$work/tree" two
git merge -q one >/dev/null 2>&1 || mkdir .git/vexel-merge.lock
git merge --abort 2>/dev/null &
git -C "$work/tree" merge -q one >/dev/null 2>&1 &
other=.git/worktrees/tree/vexel-merge-records
sleep 1 && touch "$work/slow"
check "neither goes on without the lock" test -e .git/vexel-merge-records -a ! -e "$other"
rmdir .git/vexel-merge.lock && wait
check "the other one has its record and the hook" test -e "$other" -a -x .git/hooks/post-index-change
git -C "$work/tree" merge --abort
check "no record of it is left" test -z "$(find "$work/tree" .git -name '*.vexel-conflicts' -newer "$work/slow")"

ln -s ../outside/hook .git/hooks/post-index-change
git merge -q one >/dev/null 2>&1 || git merge --abort
rm -f .gitattributes && ln -s ../outside/own .gitattributes && vexel-merge-git disable >/dev/null
untouched "a hook and attributes that are links"
check "no name was a command" test -z "$(find "$work" -name pwned)"

# Git itself fails, at one call after the other: what is settled then is settled as a whole, or not at all.
git init -q -b main "$work/failing" && cd "$work/failing" && vexel-merge-git enable >/dev/null
scene 2 10 >A.vexel && git add -A && git commit -q -m base && git branch theirs
scene 4 10 >A.vexel && git commit -q -a -m ours && git checkout -q theirs && scene 3 10 >A.vexel && git commit -q -a -m theirs
git checkout -q main && { git merge -q theirs >/dev/null 2>&1 || :; }
for stage in 1 2 3; do git show ":$stage:A.vexel" >"$work/version$stage"; done
mkdir "$work/fake" && cp -a "$work/failing" "$work/conflict"
cat >"$work/fake/git" <<FAKE
#!/bin/sh
echo >>"$work/calls"
[ \$(wc -l <"$work/calls") != "\$FAILING" ] || { echo "fatal: a test" >&2; exit \$FAILURE; }
exec "$(command -v git)" "\$@"
FAKE
chmod +x "$work/fake/git"
state() { cat A.vexel && git ls-files -s && find . -name '*.path' -exec cat {} + && ls ./*.vexel-conflicts 2>/dev/null || :; }
# settle NUMBER STATUS COMMAND...: with that call of git ending with that status
settle() {
  cd "$work" && rm -rf failing && cp -a conflict failing && cd failing && : >"$work/calls" && status=0
  FAILING=$1 FAILURE=$2 PATH="$work/fake:$PATH" "${@:3}" >/dev/null 2>"$work/err" || status=$?
}
for command in "resolve --theirs A.vexel" "resolve --as-is A.vexel" "mergetool $work/version1 $work/version2 $work/version3 A.vexel"; do
  sed -i 's/^# theirs.ours.base/theirs/' "$work/conflict/A.vexel.vexel-conflicts"
  # shellcheck disable=SC2086
  settle 0 0 vexel-merge-git $command
  state >"$work/settled" && calls=$(wc -l <"$work/calls")
  check "nothing fails by itself" test $status -eq 0
  for ((call = 1; call <= calls; ++call)); do
    for failure in 127 128; do
      # shellcheck disable=SC2086
      settle $call $failure vexel-merge-git $command
      check "nothing is settled by halves: $command, call $call, status $failure" eval \
        'cmp -s <(state) "$work/settled" || { cmp -s <(state) <(cd ../conflict && state) && [ $status -ne 0 ] && [ -s "$work/err" ]; }'
    done
  done
done
end_of_checks "git merges in a hostile repository"
