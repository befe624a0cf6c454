#!/usr/bin/env bash
# limits.sh PROGRAM [LIBRARY]: merges where the machine gives too little, and shows hostile names on a terminal.
# LIBRARY lets a signal come at a chosen time (see faults/fail_calls.cpp).
set -euo pipefail
program=$(realpath "$1")
library=${2:+$(realpath "$2")}
folder=$(mktemp -d)
trap 'rm -rf "$folder"' EXIT
cd "$folder"

fail() {
  printf 'limits: %s\n' "$*" >&2
  exit 1
}
scene() { # scene NAME FIRST LAST: enough lights for threads, the first and the last with these ranges
  { printf '%%YAML 1.1\n%%TAG !v! tag:vexel.com,2011:\n'
    for ((id = 1; id <= objects; id++)); do
      printf -- '--- !v!108 &%d\nLight:\n  m_Range: %d\n' "$id" "$((id == 1 ? $2 : id == objects ? $3 : 1))"
    done
  } > "$1.vexel"
}
# The larger ones take more than two threads to write, in more than one go.
for objects in 9000 3000; do
  scene base 1 1
  scene left 2 1
  scene right 1 3
  scene wanted 2 3
  for threads in -h --nothreads; do
    "$program" merge -h "$threads" --fallback none base.vexel left.vexel right.vexel out.vexel > output
    cmp -s out.vexel wanted.vexel || fail "$objects objects, $threads"
  done
done
merge=("$program" merge -h --fallback none base.vexel left.vexel right.vexel)

# One thread, and one descriptor for all three files.
(exec 3>&- && ulimit -n 4 && "${merge[@]}" few.vexel > output) && cmp -s few.vexel wanted.vexel || fail 'few descriptors'
# The limit doesn't bind root; an ordinary user may not reach the build folder.
as_user=()
if [[ $EUID == 0 ]]; then as_user=(setpriv --reuid=65534 --clear-groups); fi
cp "$program" "${program%/*}/mergerules.txt" .
chmod 777 .
("${as_user[@]}" bash -c 'ulimit -u 1 && exec "$@"' limits "./${program##*/}" "${merge[@]:1}" one.vexel > one) &&
  cmp -s one.vexel wanted.vexel || fail 'no threads'

echo old > old.vexel
for megabytes in {5..150..5}; do
  for threads in -h --nothreads; do
    status=0
    (ulimit -v $((megabytes * 1000)) && "$program" merge "$threads" "${merge[@]:2}" old.vexel > output 2> messages) || status=$?
    if [[ $status == 0 ]]; then
      cmp -s old.vexel wanted.vexel || fail "$megabytes MB: status 0 without the result"
      echo old > old.vexel
    elif [[ $status == 1 ]]; then
      [[ "$(< messages)" == 'Out of memory' && "$(< old.vexel)" == old ]] || fail "$megabytes MB: $(< messages)"
    elif [[ $status != 127 ]]; then # Before the program starts, the system says itself that there is no room.
      fail "$megabytes MB: status $status"
    fi
  done
done
[[ $status == 0 ]] || fail '150 MB are not enough'

# Deep in brackets libyaml is slow: with many values at once, and spread over objects whose tags hide the depth.
values=$(head -c 2000000 /dev/zero | sed 's/\x0/a,/g')
{ head -n 2 base.vexel && printf -- '--- !v!1 &1\nA: %s%s\n' "$(printf '[%.0s' {1..990})" "$values"; } > deep.vexel
{ head -n 2 base.vexel && for id in {1..20}; do
  printf -- '--- !v!1 &%d\nA: %s%s%s\n' "$id" "$(printf '[!<]> %.0s' {1..400})" "${values::30000}" "$(printf ']%.0s' {1..400})"
done; } > tags.vexel
for file in deep tags; do
  timeout 40 "$program" diff -h base.vexel "$file.vexel" > output 2> messages && fail "$file: read" || status=$?
  [[ $status == 1 && "$(< messages)" == *'YAML nests too many values in brackets' ]] || fail "$file: status $status"
done

# Each of many components of one object may exclude each other one.
components() { # components NAME CLASS FIRST LAST: of this class, with these file IDs, behind a light
  { head -n 2 base.vexel && printf -- '--- !v!1 &1\nGameObject:\n  m_Component:\n  - component: {fileID: 80000}\n'
    for ((id = $3; id <= $4; id++)); do printf '  - component: {fileID: %d}\n' "$id"; done
    for ((id = $3; id <= $4; id++)); do printf -- '--- !v!%d &%d\nC:\n  m_GameObject: {fileID: 1}\n' "$2" "$id"; done
    printf -- '--- !v!108 &80000\nLight:\n  m_GameObject: {fileID: 1}\n'
  } > "$1.vexel"
}
components bare 0 1 0
components cloths 21 2 60000
components boxes 17 70000 70000
{ head -n 2 base.vexel && printf -- '--- !v!0 &1\nMergeTypeInfo:\n'
  printf -- "- {id: %d, name: n, ismulti: 1, baseid: 0, requires: '', conflicts: '%s'}\n" 17 '' 21 11000000; } > types.vexel
timeout 20 "${merge[@]:0:5}" --typeInfo types.vexel bare.vexel cloths.vexel boxes.vexel > output || status=$?
[[ $status == 3 && $(grep -c '^Right ' output) == 1 ]] || fail "many components: status $status"

status=0
(ulimit -f 8 && "${merge[@]}" old.vexel > output) 2> messages || status=$?
[[ $status -gt 128 && "$(< old.vexel)" == old ]] || fail "file size: status $status"
status=0
"${merge[@]}" old.vexel >&- 2> messages || status=$?
[[ $status == 1 && "$(< old.vexel)" == old ]] || fail "closed output: status $status"
"$program" strip -h base.vexel left.vexel > plain
echo -old > log && (echo before; "$program" strip -h base.vexel left.vexel /dev/stdout; echo after) >> log
printf '%s\n' -old before "$(< plain)" after | cmp -s - log || fail 'the log is not continued'
(exec 7> fd7 && rm fd7 && "${merge[@]}" /dev/fd/7 > output && cmp -s /dev/fd/7 wanted.vexel) || fail 'an open file without a name'
(exec 3>&- && ulimit -n 4 && "$program" strip -h base.vexel left.vexel /dev/stdout) | cmp -s - plain || fail 'pipe'
scene clash 3 3
status=0
(exec 3>&- && ulimit -n 4 && "${merge[@]:0:5}" -p base.vexel left.vexel clash.vexel merged base right) > output || status=$?
[[ $status == 2 && -s base && -s right ]] || fail "few descriptors for premerged files: status $status"
cp wanted.vexel run_as && chmod 4755 run_as && "${merge[@]}" run_as > output && [[ $(stat -c %a run_as) == 755 ]] || fail 'mode'

status=0
"${merge[@]:0:5}" --timing -o records "${merge[@]:5}" old.vexel > /dev/full 2> messages || status=$?
[[ $status == 1 && "$(< old.vexel)" == old && "$(< messages)" == 'Cannot write to standard output' ]] || fail 'full output'

# Overwritten in place by a shorter text, with a signal behind one write after the other.
mkdir closed && : > calls && : > count && chmod 666 calls count
for write in ${library:+1 2 3 4 5 6 7 8 9}; do
  head -c 8 /dev/zero > count && cp "$library" library.so
  cat left.vexel left.vexel > closed/file && cp closed/file twice && chmod 666 closed/file && chmod 555 closed
  "${as_user[@]}" env LD_PRELOAD="$PWD/library.so" FAULT_COUNT=count FAULT_LOG=calls FAULT="write -15 $write 0" \
    "./${program##*/}" "${merge[@]:1}" closed/file > output || true
  chmod 755 closed
  cmp -s closed/file wanted.vexel || cmp -s closed/file twice || fail 'a file is half new'
done
[[ -z $library ]] || grep -q 'failed.*closed/file' calls || fail "no signal came while writing in place: $(< calls)"
# What scripts look for where a file or the tool's shell can't be made.
printf '%s\n' '* use "/bin/true" "%d"' > tools
while [[ -n $library ]] && read -r kind error at name; do
  head -c 8 /dev/zero > count
  LD_PRELOAD=$library FAULT_COUNT=count FAULT_LOG=calls FAULT="$kind $error $at 0" "${merge[@]:0:4}" tools -p \
    base.vexel left.vexel clash.vexel old.vexel > output 2> messages && fail "$kind $at: status 0"
  [[ "$(< messages)" == "$name"* ]] || fail "$kind $at: $(< messages)"
done << 'CASES'
create 28 1 Couldn't create temporary output file for merge result
create 28 3 Couldn't create temporary output premerge base file for merge result
create 28 7 Couldn't create temporary output2 file for merge result
process 11 1 Could not start fallback merge command '/bin/true' code -1 Resource temporarily unavailable
CASES
[[ -z "$(find . -name '.merge*')" ]] || fail 'a temporary file stayed'

# The bytes are spelled out, and the shell is named: script takes the user's, which needn't know these quotes.
name=$'\e[1m\xc2\x9b\xe8\x8b\xa9\xff\n.vexel'
shown=$(SHELL=/bin/sh name=$name script -qec "$program strip -h base.vexel \"\$name\"" /dev/null | tr -d '\r' || true)
[[ "$shown" == *$'\'\\x1b[1m\\xc2\\x9b\xe8\x8b\xa9\\xff\n.vexel\': Cannot open file\nhint: No such file or directory' ]] || fail "$shown"
