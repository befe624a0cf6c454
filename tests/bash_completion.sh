#!/usr/bin/env bash
# Types commands with tabs in them into a real bash, and looks at what the commands are then given; asks fish for its
# candidates; has zsh check the syntax of its own:
#   bash_completion.sh SOURCE_DIR
set -euo pipefail

completions="$(cd "$1" && pwd)/completions"
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT
for name in $(compgen -e GIT_ || true); do unset "$name"; done
export HOME="$work" XDG_CONFIG_HOME="$work" XDG_DATA_HOME="$work" GIT_CONFIG_NOSYSTEM=1 TERM=dumb INPUTRC=/dev/null

export PATH="$work/bin:$PATH"
mkdir "$work/bin" "$work/project" && cd "$work/project"
for program in VexelYAMLMerge vexel-merge-git vexel-merge-report vexel-merge-view; do
  printf '#!/bin/sh\n{ printf "%%s" "${0##*/}"; printf "<%%s>" "$@"; echo; } >>"$HOME/calls"\n' >"$work/bin/$program"
  chmod +x "$work/bin/$program"
done

# An unmerged file with a blank in its name, one that is settled, and one that is no asset.
git init -q
mkdir Assets Code && touch "Assets/Main Scene.vexel" Assets/Other.prefab Assets/Mainland.txt
git add Assets/Other.prefab
blob="$(git hash-object -w --stdin </dev/null)"
printf "100644 $blob %d\tAssets/Main Scene.vexel\n" 1 2 3 | git update-index --index-info
printf 'Left  %s change to 4\nRight 11.Light.m_Range delete\n' 11.Light.m_Range '12.$(touch${IFS}$HOME/called)' \
  >"Assets/Main Scene.vexel.vexel-conflicts"
git tag 'first;touch${IFS}$HOME/called' "$blob"

printf '%b\n' "source $completions/VexelYAMLMerge.bash" 'vexel-merge-git res\t\t' \
  'vexel-merge-git resolve --path 12\t' 'vexel-merge-git report fir\t' \
  'vexel-merge-git resolve --le\t--pa\t11\tAssets/Main\\ S\t' 'vexel-merge-git enable --pat\t\t' \
  'VexelYAMLMerge me\t--fallb\tno\t--nothr\tAssets/O\t"Assets/Mai\t' 'cd Code' \
  'vexel-merge-git resolve -- \t' 'vexel-merge-report --conf\t../Assets/O\t' 'vexel-merge-view --no\t../Assets/O\t' exit |
  python3 -c 'import pty; pty.spawn(["bash", "--norc", "--noprofile", "-i"])' >"$work/terminal" 2>&1
diff - "$work/calls" <<'CALLS' || { cat "$work/terminal" >&2; exit 1; }
vexel-merge-git<resolve><Assets/Main Scene.vexel>
vexel-merge-git<resolve><--path><12.$(touch${IFS}$HOME/called)>
vexel-merge-git<report><first;touch${IFS}$HOME/called>
vexel-merge-git<resolve><--left><--path><11.Light.m_Range><Assets/Main Scene.vexel>
vexel-merge-git<enable><--patterns><*.vexel *.prefab *.meta>
VexelYAMLMerge<merge><--fallback><none><--nothreads><Assets/Other.prefab><Assets/Main Scene.vexel>
vexel-merge-git<resolve><--><../Assets/Main Scene.vexel>
vexel-merge-report<--conflicts><../Assets/Other.prefab>
vexel-merge-view<--no-browser><../Assets/Other.prefab>
CALLS

zsh -n "$completions/_VexelYAMLMerge"
for file in "$completions"/*.fish; do
  fish --no-config -c 'source $argv[1]; complete -C "$argv[2]"' "$file" "$(basename "$file" .fish) "
done | cut -f 1 | diff - <(printf '%s\n' diff merge strip unittest check disable enable preview report resolve review status Assets/ Code/ \
  Assets/ Code/)
