#!/usr/bin/env bash
# Looks into built programs for what makes faults in them hard to use: hardened.sh PROGRAMS...
set -euo pipefail

failures=0
expect() { # expect WHAT PATTERN TEXT
  grep -Eq -- "$2" <<<"$3" || { echo "FAILED: $program: $1" >&2; failures=$((failures + 1)); }
}
for program in "$@"; do
  dynamic="$(readelf --wide --dynamic "$program")"
  # Those of the C++ library may be linked in.
  symbols="$(readelf --wide --syms "$program")"
  expect "can be loaded anywhere" 'FLAGS_1.* PIE' "$dynamic"
  expect "has its tables read-only" 'GNU_RELRO' "$(readelf --wide --segments "$program")"
  expect "has all of them read-only, bound at the start" 'FLAGS_1.* NOW' "$dynamic"
  expect "guards its stack" '__stack_chk_fail' "$symbols"
  expect "calls fortified functions" '__[a-z]+_chk(@|$)' "$symbols"
  expect "checks indices of the standard library" '__glibcxx_assert_fail' "$symbols"
done
[[ "$failures" -eq 0 ]] && echo "$# programs are hardened"
