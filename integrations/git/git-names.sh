# Names of files, which strangers choose: in lists, in commands and on the terminal. vexel-merge-git sources this file.
# Lists have one path a line, as git quotes it where it has to, so that a line break in a name is none in the list.

# quoted TEXT: as one word of a shell command.
quoted() (
  text=$(printf '%s.' "$1" | sed "s/'/'\\\\''/g")
  printf "'%s'\n" "${text%.}"
)

# typeable TEXT: the same for a person to paste into bash, zsh or ksh, where a terminal can't show the text as it is.
typeable() (
  tab=$(printf '\t')
  text=$(printf '%s.' "$1" | sed "s/\\\\/&&/g; s/'/\\\\'/g; s/$tab/\\\\t/g" | escaped '\n')
  case $1 in
    *"$tab"*) ;;
    *) if [ "$(printf '%s.' "$1" | escaped '\n')" = "$1." ]; then quoted "$1" && return; fi ;;
  esac
  printf "$'%s'\n" "${text%.}"
)

# Git's commands with the quoting of our lists, whatever the user has set.
git_names() { git -c core.quotePath=true "$@"; }

# line_of PATH: its line in a list. No attribute has a blank in its value.
line_of() (
  line=$(git_names check-attr merge -- "$1")
  printf '%s\n' "${line%: merge: *}"
)

# path_of LINE: sets $path. A command's output would lose the line breaks at its end.
path_of() {
  path=$1
  case $1 in
    '"'*'"')
      path=${path#?}
      path=$(printf '%s\n' "${path%?}" | sed 's/\\\\/\\134/g; s/\\"/"/g; s/\\\([0-7][0-7][0-7]\)/\\0\1/g')
      path=$(printf '%b.' "$path")
      path=${path%.}
      ;;
  esac
}

# ours_among: of a list on standard input, the paths that the attributes give to us. Expects the top folder.
ours_among() { git_names check-attr --stdin merge | sed -n 's/: merge: vexel$//p'; }

# unmerged_below PATH...: a list, with paths from the top folder.
unmerged_below() { git_names ls-files --unmerged --full-name -- "$@" | cut -f 2- | LC_ALL=C sort -u; }

# escaped BREAK: standard input with "\x1b" and the like for what steers a terminal and for what is not UTF-8. BREAK
# stands where a line ends and another one follows.
escaped() {
  BREAK=$1 LC_ALL=C awk '
    # How many bytes the character at a place has, 1 also where there is none.
    function character(at,   first, size, i) {
      first = code[substr($0, at, 1)]
      size = first < 194 || first > 244 ? 1 : first < 224 ? 2 : first < 240 ? 3 : 4
      for (i = 1; i < size; i++) if (int(code[substr($0, at + i, 1)] / 64) != 2) return 1
      # The second range of control characters.
      return first == 194 && code[substr($0, at + 1, 1)] < 160 ? 1 : size
    }
    BEGIN {for (i = 1; i < 256; i++) code[sprintf("%c", i)] = i}
    {
      out = ""
      for (at = 1; at <= length($0); at += size) {
        size = character(at)
        first = code[substr($0, at, 1)]
        unfit = size == 1 && (first > 126 || first < 32 && first != 9)
        out = out (unfit ? sprintf("\\x%02x", first) : substr($0, at, size))
      }
      printf "%s%s", (NR > 1 ? ENVIRON["BREAK"] : ""), out
    }
    END {if (NR) print ""}'
}

line_break='
'
# Of a message, a terminal gets one line, and any other reader what was said.
say() { if [ -t 2 ]; then printf '%s' "$*" | escaped '\n'; else printf '%s\n' "$*"; fi >&2; }
tell() { if [ -t 1 ]; then printf '%s' "$*" | escaped '\n'; else printf '%s\n' "$*"; fi; }
# shown NAME: as a part of say_lines.
shown() { if [ -t 2 ]; then printf '%s' "$1" | escaped '\n'; else printf '%s\n' "$1"; fi; }
say_lines() { if [ -t 2 ]; then escaped "$line_break"; else cat; fi >&2; }
tell_lines() { if [ -t 1 ]; then escaped "$line_break"; else cat; fi; }

complain() { say "error: $*"; }

die() {
  complain "$*"
  exit 1
}

wrong_usage() {
  complain "$*; see vexel-merge-git --help"
  exit 129
}
