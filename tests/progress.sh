#!/usr/bin/env bash
# What takes long says on a terminal what it does, and nowhere else:
#   progress.sh PROGRAM
set -euo pipefail
# shellcheck source=tests/support/end_to_end.sh
source "$(dirname "${BASH_SOURCE[0]}")/support/end_to_end.sh"
cd "$work"

scene 2 10 >base.vexel && scene 4 10 >left.vexel && scene 2 20 >right.vexel && scene 4 20 >wanted.vexel && mkfifo slow.vexel
# slowly SECONDS COMMAND...: one of the command's files comes late.
slowly() {
  { sleep "$1" && cat right.vexel; } >slow.vexel &
  "${@:2}"
}
terminal() { SHELL=$BASH TERM=${term-xterm} script -qec "$1" /dev/null | tr '\r' '\n' >out; }
merge="VexelYAMLMerge merge -h --fallback none base.vexel left.vexel slow.vexel"
draws() { grep -qF "$1" out; }

check "a slow merge is merged" slowly 1.5 terminal "$merge out.vexel"
check "and says what it does" draws $'Merging out.vexel: reading (1 s)'
check "until there is something else to say" grep -qx $'\e\\[KConflicts:' out
check "with the same result" cmp out.vexel wanted.vexel
check "a quick one says nothing" terminal "${merge/slow/right} out.vexel"
check "at all" refuses draws Merging
term=dumb check "a terminal that can't rewrite a line gets none" slowly 1.5 terminal "$merge out.vexel"
check "and no control characters" refuses draws $'\e'
check "a pipe gets no line" slowly 1.5 terminal "$merge out.vexel 2>&1 | cat"
check "for sure" refuses draws Merging
slowly 2.5 terminal "VexelYAMLMerge merge --safe -h --fallback none missing.vexel left.vexel slow.vexel out.vexel" || :
check "an error has the line to itself" grep -qx $'\e\\[KCannot merge .*missing.vexel.*' out

git init -q -b main repository && cd repository && vexel-merge-git enable >/dev/null && cp ../{base,left,right}.vexel .
git add -A && git commit -q -m base
driver="vexel-merge-git merge-driver base.vexel right.vexel left.vexel 7 \$'the \\e[31m scene'"
check "a short merge among few says nothing" terminal "touch .git/index.lock; $driver"
check "indeed" refuses draws Merging
touch -d '5 seconds ago' .git/index.lock && cp ../right.vexel .
check "whoever has waited for other files is told at once" terminal "$driver"
check "for which one" draws 'Merging the \x1b[31m scene'
check "which goes as the others" test "$(tail -n 1 out)" = $'\e[K'

end_of_checks "what takes long says so"
