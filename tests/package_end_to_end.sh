#!/usr/bin/env bash
# Makes the Debian package of a build, installs it into a folder, and uses what is there; then does the same with
# `cmake --install`. Runs as root or where user namespaces are allowed, since packaged files belong to root:
#   package_end_to_end.sh BUILD_DIR SOURCE_DIR
set -euo pipefail

build="$(cd "$1" && pwd)"
examples="$(cd "$2" && pwd)/examples"
work="$(mktemp -d)"
trap 'rm -rf "$work"' EXIT
export HOME="$work" PATH="$PATH:/usr/sbin:/sbin" LC_ALL=C.UTF-8
for name in DESTDIR $(compgen -e GIT_ || true); do unset "$name"; done
chmod 755 "$work"
cd "$work"

failures=0
check() { # check WHAT COMMAND...
  if ! "${@:2}" >check.log 2>&1; then
    echo "FAILED: $1" >&2
    cat check.log >&2
    failures=$((failures + 1))
  fi
}
as_root() { if [[ "$(id -u)" == 0 ]]; then "$@"; else unshare --map-root-user "$@"; fi; }
prints_nothing() { "$@" >printed 2>&1 && cat printed && ! [ -s printed ]; }
fails_with() { local status=0; "${@:2}" || status=$?; [ "$status" -eq "$1" ]; }
packaging_value() { sed -n "s/^set($1 \"\(.*\)\")\$/\1/p" "$build/CPackConfig.cmake"; }
version="$(packaging_value CPACK_PACKAGE_VERSION)"

# works PREFIX: whether the installed programs run by their links, and find what they look for beside themselves.
works() {
  local bin="$1/bin"
  fails_with 2 "$bin/VexelYAMLMerge" merge -h --fallback none -o records "$examples"/{base,left,right}.vexel merged &&
    grep -qx 'Right 500302.Light.m_Intensity change to 3.2' records &&
    grep -qx -- '--- !v!1 &101500' merged &&
    "$bin/vexel-merge-report" --conflicts "$examples"/{base,left,right}.vexel >conflicts &&
    grep -q '^500302.Light.m_Intensity' conflicts &&
    fails_with 1 env CI=true "$bin/VexelYAMLMerge" merge -h "$examples"/{base,left,right}.vexel left_out 2>said &&
    grep -q '^No merge tool was started: ' said &&
    "$bin/vexel-merge-git" --version >printed && grep -qxF "vexel-merge-git $version" printed
}
# In the folder's own terms: a link that leaves it would work only on this machine.
has_no_bad_link() { prints_nothing find -L "$1" -type l && prints_nothing find "$1" -type l -lname '/*'; }

package="vexel-yaml-merge_${version}_$(dpkg --print-architecture).deb"
# With the umask of a cautious user, whose package has to be as good as anybody's.
check "cpack makes a package" bash -c 'umask 077; exec cpack --config "$1" -B made' - "$build/CPackConfig.cmake"
check "its name is Debian's" test -f "made/$package"
dpkg-deb --field "made/$package" >fields
for field in 'Package: vexel-yaml-merge' "Version: $version" 'Section: vcs' 'Recommends: git' 'Depends: .*libyaml-0-2' \
  'Maintainer: .* <.*@.*>'; do
  check "the package says $field" grep -q "^$field" fields
done

# As root it says that it should not be, unless it is allowed.
check "lintian finds nothing" prints_nothing lintian --allow-root "made/$package"

mkdir -p root/var/lib/dpkg/{info,updates} && touch root/var/lib/dpkg/{status,available}
# Small systems tell dpkg to leave out documents and man pages.
packages() { as_root dpkg --root="$work/root" --log="$work/dpkg.log" --force-depends --path-include='*' "$@"; }
check "the package can be installed" packages --install "made/$package"
check "the installed programs work" works root/usr
check "its links hold" has_no_bad_link root/usr
check "its files are for everybody to read" prints_nothing find root/usr -type f ! -perm 644 ! -perm 755
check "its folders are for everybody to enter" prints_nothing find root/usr -type d ! -perm 755
check "it has its programs and nothing else that runs" test \
  "$(cd root/usr/lib/vexel-yaml-merge && find . -perm /111 -type f | sort | xargs)" = \
  "./VexelYAMLMerge ./vexel-merge-git ./vexel-merge-report ./vexel-merge-view"
check "the programs are stripped" grep -q 'no symbols' <(nm root/usr/lib/vexel-yaml-merge/VexelYAMLMerge 2>&1)
doc=root/usr/share/doc/vexel-yaml-merge
check "the copyright can be read by machines" grep -qx 'License: Expat' "$doc/copyright"
check "the changelog is Debian's" grep -q "^vexel-yaml-merge ($version)" <(zcat "$doc/changelog.gz")
check "the completions are where the shells look" test -f root/usr/share/bash-completion/completions/vexel-merge-git \
  -a -f "$(printf 'root%s/_VexelYAMLMerge\n' $(zsh -f -c 'print -l $fpath') | xargs -d '\n' ls 2>/dev/null)" \
  -a -f root/usr/share/fish/vendor_completions.d/vexel-merge-git.fish

for page in VexelYAMLMerge.1 vexel-merge-git.1 vexel-merge-report.1 mergerules.txt.5 mergespecfile.txt.5; do
  file="root/usr/share/man/man${page##*.}/$page.gz"
  check "$page has a name that apropos finds" grep -q ": \"${page%.*} - ." <(lexgrog "$file")
  check "$page is formatted without a warning" prints_nothing \
    bash -c 'man --warnings -E UTF-8 -l -Tutf8 -Z "$1" >/dev/null' - "$file"
  check "$page has a last section" grep -q 'SEE ALSO' <(man -l "$file" 2>&1)
done

check "the package can be purged" packages --purge vexel-yaml-merge
check "nothing of it is left" test ! -e root/usr

check "cmake --install takes DESTDIR" env DESTDIR="$work/staged" cmake --install "$build" --prefix /opt/vexel-test
check "the staged programs work" works staged/opt/vexel-test
check "nothing is beside the prefix" prints_nothing find staged -type f ! -path 'staged/opt/vexel-test/*'
check "nothing is in the prefix itself" test ! -e /opt/vexel-test
check "cmake --install takes a prefix" cmake --install "$build" --prefix "$work/a prefix"
check "an installed tree has no bad link" has_no_bad_link "a prefix"
mv "a prefix" moved
check "an installed tree can be moved" works moved

[[ "$failures" -eq 0 ]] && echo "the package and the installed trees work"
