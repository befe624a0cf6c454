# Our lines in files that belong to somebody else, between two marks. vexel-merge-git sources this file.
# What stood there before is remembered in the file $state, in git's configuration format, and a block that was there in
# a file of its own: no command takes arguments of any length.

block_begin='# vexel-merge-git begin ("vexel-merge-git disable" removes this)'
block_end='# vexel-merge-git end'

recall() { git config -f "$state" --get "$1"; }
remember() { git config -f "$state" "$1" "$2"; }

# block_part FILE WHICH: the lines "inside" or "outside" of our marks; line ends may have become a network's.
# Fails where the marks are not a pair, since nobody could say then which lines are ours.
block_part() {
  [ -f "$1" ] || return 0
  awk -v which="$2" -v b="$block_begin" -v e="$block_end" '
    {line = $0; sub(/\r$/, "", line)}
    line == b {if (seen++) bad = 1; within = 1; next}
    line == e {if (!within) bad = 1; within = 0; next}
    within && which == "inside" {print line}
    !within && which == "outside" {print}
    END {exit bad || within}' "$1" ||
    die "in $1, the lines '$block_begin' and '$block_end' are not a pair: put that right first"
}
has_block() { [ -f "$1" ] && tr -d '\r' <"$1" | grep -qxF "$block_begin"; }
without_final_newline() { awk 'NR > 1 {print ""} {printf "%s", $0}'; }

# set_block FILE NAME LINES: the lines between our marks, at the end unless the marks are there already.
set_block() {
  inside=$(block_part "$1" inside) || exit
  [ "$inside" != "$3" ] || return 0
  changed=true
  if has_block "$1"; then
    if ! recall "file.$2.before" >/dev/null; then
      remember "file.$2.before" marked
      block_part "$1" inside >"$state.$2"
    fi
    printf '%s\n' "$3" | write_block "$1"
    return 0
  fi
  before=there
  [ -f "$1" ] || before=absent
  if [ -f "$1" ] && lacks_final_newline "$1"; then before=open; fi
  remember "file.$2.before" "$before"
  mkdir -p "$(dirname "$1")"
  {
    [ ! -f "$1" ] || cat "$1"
    [ "$before" != open ] || echo
    printf '%s\n%s\n%s\n' "$block_begin" "$3" "$block_end"
  } | replace_file "$1"
}

# write_block FILE: standard input where our block stands.
write_block() {
  awk -v b="$block_begin" -v e="$block_end" '
    {line = $0; sub(/\r$/, "", line)}
    line == e {skip = 0}
    !skip
    line == b {skip = 1; while ((getline text < "-") > 0) print text}' "$1" | replace_file "$1"
}

# restore_block FILE NAME
restore_block() {
  before=$(recall "file.$2.before") || return 0
  outside=$(block_part "$1" outside && echo .) || exit
  has_block "$1" || return 0
  if [ "$before" = marked ]; then
    # 1.0.1 remembered it among the settings.
    { cat "$state.$2" 2>/dev/null || recall "file.$2.block"; } | write_block "$1"
    return 0
  fi
  # The line break in front of our block was ours, too, unless something follows now.
  is_last=false
  if [ "$(sed -n '$p' "$1" | tr -d '\r')" = "$block_end" ]; then is_last=true; fi
  if lacks_final_newline "$1" || { [ "$before" = open ] && [ "$is_last" = true ]; }; then
    printf '%s' "${outside%.}" | without_final_newline | replace_file "$1"
  else
    printf '%s' "${outside%.}" | replace_file "$1"
  fi
  if [ "$before" = absent ] && [ ! -s "$1" ]; then rm -f "$1"; fi
}
