#!/bin/sh
# merge_fields.sh [OPTION]... BASE LEFT RIGHT: prints what the program makes of three scenes, and whether
# conflicts are left. For the tables of the documents.
#
# A scene is the fields of one component; "--- &600" starts another one, "--- &400 Transform" another class.
scene() {
  printf '%%YAML 1.1\n%%TAG !v! tag:vexel.com,2011:\n'
  printf '%s\n' '--- &1' "$1" | awk '
    /^--- / { print "--- !v!114 " $2 "\n" (NF > 2 ? $3 : "MonoBehaviour") ":\n  m_Enabled: 1"; next }
    $0 != "" { print "  " $0 }'
}
options=
while [ $# -gt 3 ]; do
  options="$options $1"
  shift
done
scene "$1" >base.vexel
scene "$2" >left.vexel
scene "$3" >right.vexel
VexelYAMLMerge merge -h --fallback none -o records $options base.vexel left.vexel right.vexel result.vexel
status=$?
[ $status = 0 ] || [ $status = 2 ] || exit
sed -e '1,2d' -e '/^--- !v!114 &1$/d' -e 's/^--- !v!114/---/' -e '/^[A-Z][A-Za-z]*:$/d' \
  -e '/^  m_Enabled: 1$/d' -e 's/^  //' result.vexel
[ $status = 0 ] || echo conflict
