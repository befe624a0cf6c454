# The pages that vexel-merge-git report makes with vexel-merge-report.

report() {
  page='' page_shown='' commit=''
  while [ $# -gt 0 ]; do
    case $1 in
      -o)
        [ $# -gt 1 ] || wrong_usage "-o needs a value"
        page=$2
        shift
        ;;
      --) break ;;
      -*) wrong_usage "unknown option '$1'" ;;
      *)
        [ -z "$commit" ] || wrong_usage "paths stand behind --"
        commit=$1
        ;;
    esac
    shift
  done
  if [ "${1-}" = -- ]; then shift; fi
  git rev-parse --show-toplevel >/dev/null || exit 128
  # Before the folder changes, from which the user's paths count.
  page_shown=$page
  case $page in
    '' | /*) ;;
    *) page=$PWD/$page ;;
  esac
  make_scratch
  if [ -n "$commit" ]; then
    list_merged "$commit" "$@"
    write_versions=write_merged_versions
  else
    list_unmerged "$@"
    write_versions=write_unmerged_versions
  fi
  report_listed
}

list_unmerged() {
  nothing="no file of ours is in conflict; name a merge commit"
  if [ $# -eq 0 ]; then go_to_top; fi
  unmerged_below "$@" >"$scratch/all"
  go_to_top
}

# list_merged COMMIT PATH...: the files that both parents have changed, or those that are named.
list_merged() {
  commit=$(git rev-parse --verify --quiet "$1^{commit}") || die "'$1' is not a commit"
  nothing="no file of ours was changed on both sides of $1"
  parents=$(git rev-list --parents -n 1 "$commit")
  shift
  ours=$(printf '%s\n' "$parents" | cut -d ' ' -f 2)
  theirs=$(printf '%s\n' "$parents" | cut -s -d ' ' -f 3)
  if [ -z "$theirs" ] || [ -n "$(printf '%s\n' "$parents" | cut -s -d ' ' -f 4)" ]; then
    die "$commit is not a merge of two commits"
  fi
  base=$(git merge-base "$ours" "$theirs") || die "the parents of $commit have no common ancestor"
  changed_since_base "$ours" "$@" >"$scratch/in-ours"
  changed_since_base "$theirs" "$@" >"$scratch/in-theirs"
  LC_ALL=C comm -12 "$scratch/in-ours" "$scratch/in-theirs" >"$scratch/all"
  go_to_top
}

# changed_since_base COMMIT PATH...
changed_since_base() {
  side_commit=$1
  shift
  GIT_LITERAL_PATHSPECS=1 git_names diff --name-only --no-relative --no-renames "$base" "$side_commit" -- "$@" |
    LC_ALL=C sort
}

write_merged_versions() {
  base_file="base $(git rev-parse --short "$base")"
  left_file="left $(git rev-parse --short "$theirs")"
  right_file="right $(git rev-parse --short "$ours")"
  if version "$base:$1" "$base_file" && version "$theirs:$1" "$left_file" && version "$ours:$1" "$right_file"; then
    return 0
  fi
  say "$1: not in all three versions, so there is nothing to compare"
  return 1
}
version() { git cat-file --filters "$1" >"$scratch/$2" 2>/dev/null; }

write_unmerged_versions() {
  base_file=base left_file=left right_file=right
  write_stages "$1" || return 1
  are_assets "$scratch/base" "$scratch/left" "$scratch/right" || { say "$1 was merged as text"; return 1; }
}

report_listed() {
  read_rule_options
  ours_among <"$scratch/all" >"$scratch/assets"
  if [ ! -s "$scratch/assets" ]; then die "$nothing"; fi
  if [ -n "$page" ] && [ "$(wc -l <"$scratch/assets")" -gt 1 ]; then
    die "-o takes one file's page; name its path behind --"
  fi
  if [ -n "$page" ] && leaves_top "$page"; then die "$page_shown lies behind a symbolic link of the work tree, or is one"; fi
  outcome=0
  while IFS= read -r line; do
    path_of "$line"
    asset=$path
    report_asset || outcome=1
  done <"$scratch/assets"
  return "$outcome"
}

# Prints where the page of $asset is.
report_asset() {
  "$write_versions" "$asset" || return 1
  target=$page
  if [ -z "$target" ]; then
    pages=$(git_path vexel-merge-report)
    target=$pages/$asset.html
    # Not all that an asset may be called has room for a suffix, and a folder can be called like another asset's page.
    if [ "$(printf '%s' "${asset##*/}" | wc -c)" -gt 200 ] || ! mkdir -p "${target%/*}" 2>/dev/null ||
      [ -d "$target" ]; then
      target=$pages/$(printf '%s' "$asset" | git hash-object --stdin).html
      mkdir -p "$pages" || return 1
    fi
  fi
  case $target in
    /*) ;;
    *) target=$PWD/$target ;;
  esac
  title=$asset
  [ -z "$commit" ] || title="$asset, the parents of $(git rev-parse --short "$commit") merged anew"
  eval "set -- $options"
  # What is settled in the record of the conflict at hand shows as settled.
  find_record "$asset"
  if [ -z "$commit" ] && [ -n "$record" ]; then
    decided_in "$record" >"$scratch/decided"
    set -- "$@" -i decided
  fi
  # From their folder, since the page shows the paths that were given.
  if ! (cd "$scratch" && "$reporter" "$@" -o "$target" --title "$title" "$base_file" "$left_file" "$right_file") \
    2>"$scratch/messages"; then
    say_messages "$base_file" "$left_file" "$right_file" "$@"
    return 1
  fi
  tell "${page_shown:-$target}"
}
