#!/usr/bin/env bash
# Runs the program as Mercurial runs it, with the set-up that the manual tells its readers to copy:
#   hg_end_to_end.sh PROGRAM
set -euo pipefail
# shellcheck source=tests/support/end_to_end.sh
source "$(dirname "${BASH_SOURCE[0]}")/support/end_to_end.sh"

config="$project/integrations/mercurial/hgrc"
check "the manual shows the set-up" shows "$project/docs/mercurial.md" "$config"
cp "$config" "$HOME/.hgrc"
# Only this file counts: the system's may name tools that open a window or the terminal.
export HGRCPATH="$HOME/.hgrc" HGUSER=Test

file="Küche/Main Scene.vexel"
has_values() { cmp "$file" <(scene "$1" "$2"); }
quietly() { "$@" </dev/null >"$work/log" 2>&1; }
commit() { # commit TAG INTENSITY RANGE TEXT [NAME], on top of "start"
  hg update -q -C start && scene "$2" "$3" | sed "s/Lamp/${5:-Lamp}/" >"$file"
  printf 'a\nb\nc\nd\n%s\n' "$4" >notes.txt
  hg commit -q -m "$1" && hg tag -q -l "$1"
}

hg init -q "$work/repository" && cd "$work/repository"
mkdir Küche && scene 2 10 >"$file" && printf 'a\nb\nc\nd\ne\n' >notes.txt
hg commit -q -A -m base && hg tag -q -l start
commit brighter 5 10 e
commit wider 2 40 e
commit darker 1 40 e
commit renamed 2 10 e Sun
commit noted 2 10 f
commit other-notes 2 10 g

hg update -q -C brighter
check "a merge without conflict succeeds" quietly hg merge wider
check "it has both values" has_values 5 40
check "nothing is left to resolve" test "$(hg resolve -l)" = "R $file"
hg update -q -C brighter
check "a graft succeeds" quietly hg graft renamed
check "it has both edits" cmp "$file" <(scene 5 10 | sed 's/Lamp/Sun/')
check "the program made it, although a textual merge could" grep -qFx "Conflict handling:" "$work/log"
hg update -q -C wider
check "a rebase succeeds" quietly hg --config extensions.rebase= rebase --keep -d brighter
check "it has both values after that" has_values 5 40

hg update -q -C brighter
check "a merge with a conflict fails" refuses quietly hg merge darker
check "the user sees theirs" grep -qFx "Left  11.Light.m_Intensity change to 1" "$work/log"
check "and mine" grep -qFx "Right 11.Light.m_Intensity change to 5" "$work/log"
check "the file is unresolved" test "$(hg resolve -l)" = "U $file"
check "all else is merged, without markers" has_values 2 40
check "nobody can commit it" refuses quietly hg commit -m early
printf 'Conflict handling:\nleft 11.Light.m_Intensity\n' >.hg/vexel-choices
check "a choice settles it" quietly hg --cwd Küche resolve --tool vexel-settle "${file#*/}"
check "it has theirs where that was chosen" has_values 1 40
check "it is resolved" test "$(hg resolve -l)" = "R $file"
check "it can be committed" quietly hg commit -m merged

hg update -q -C brighter
check "a graft with a conflict stops" refuses quietly hg graft darker
scene 3 40 >"$file" && hg resolve -q --mark "$file" 2>/dev/null
check "an edited file can be marked, and the graft go on" quietly hg graft -q --continue
check "it has what was edited" has_values 3 40

hg update -q -C brighter && printf '[exclusions]\nexclude *.Light\n' >rules.txt
tool=$(hg config merge-tools.vexel.args)
check "with rules of the repository, two edits of one light are a conflict" refuses quietly hg merge wider \
  --config merge-tools.vexel.args="${tool/--force/--force --rules rules.txt}" --config ui.origbackuppath=.hg/origbackups
check "the backup goes where it is told to" test -f ".hg/origbackups/$file"

hg update -q -C noted
check "other files conflict as ever" refuses quietly hg merge other-notes
check "with Mercurial's own markers" grep -q '^<<<<<<<' notes.txt

end_of_checks "Mercurial merges through the program"
