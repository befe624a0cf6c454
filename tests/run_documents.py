#!/usr/bin/env python3
# Runs what documents show: run_documents.py <folder of the programs> <document>...
#
# A document is one session of one shell, in an empty folder of its own:
#   a block marked `console`   Lines that begin with "$ " are commands, continued where they end in a backslash.
#                              What follows is the output, both streams together. A line "..." stands for any
#                              lines; blanks at the end of a line don't count, as nobody sees them.
#   <!-- file: NAME -->        The block below it becomes this file. Where the comment goes on below its first
#                              line, that is the file, hidden from readers.
#   <!-- copy: NAME... -->     Copies files or folders of the repository.
#   <!-- run: COMMAND -->      Is run, and prints nothing: what readers need not see.
#   <!-- table: COMMAND -->    Each row of the table below it is a run: the cells between the first and the last
#                              are the arguments, the last one is the output. A cell "—" is empty.

import os
import re
import shlex
import subprocess
import sys
import tempfile
from pathlib import Path

REPOSITORY = Path(__file__).resolve().parent.parent
TIME_LIMIT_SECONDS = 120
ITEM = re.compile(r"^<!-- file: (?P<hidden_name>\S+)\n(?P<hidden>[\s\S]*?)^-->$"
                  r"|^<!-- file: (?P<name>\S+) -->\n+```.*\n(?P<content>[\s\S]*?)^```$"
                  r"|^<!-- copy: (?P<copy>.+) -->$"
                  r"|^<!-- run: (?P<run>.+) -->$"
                  r"|^<!-- table: (?P<table>.+) -->\n+\|.*\n\|.*\n(?P<rows>(?:\|.*\n)+)"
                  r"|^```console\n(?P<session>[\s\S]*?)^```$", re.MULTILINE)
COMMAND = re.compile(r"^\$ ((?:.*\\\n)*.*)\n((?:(?!\$ ).*\n)*)", re.MULTILINE)
ROW = re.compile(r"^\|(.*)\|$", re.MULTILINE)


def steps(text):
    """The command, the wanted output and the place of every step."""
    for item in ITEM.finditer(text):
        if name := item["hidden_name"] or item["name"]:
            content = item["hidden"] if item["hidden_name"] else item["content"]
            yield f"mkdir -p $(dirname {name}); printf %s {shlex.quote(content)} >{name}", "", item.start()
        elif item["copy"]:
            yield f"tar c -C {shlex.quote(str(REPOSITORY))} {item['copy']} | tar x", "", item.start()
        elif item["run"]:
            yield item["run"], "", item.start()
        elif item["rows"]:
            for row in ROW.finditer(item["rows"]):
                text_of_cells = row[1].replace("`", "").replace("<br>", "\n")
                cells = [cell.strip(" —") for cell in text_of_cells.split("|")]
                yield f"{item['table']} {shlex.join(cells[1:-1])}", cells[-1], item.start("rows") + row.start()
        else:
            for command in COMMAND.finditer(item["session"]):
                yield command[1], command[2], item.start("session") + command.start()


def shown(output):
    return "".join(f"{line.rstrip()}\n" for line in output.rstrip().splitlines())


def check(programs, document):
    text = document.read_text()
    wanted = list(steps(text)) or sys.exit(f"{document}: nothing to run")
    if len(re.findall(r"<!-- (?:file|copy|run|table): |^```console$", text, re.MULTILINE)) != len(ITEM.findall(text)):
        sys.exit(f"{document}: not all that is marked to be run can be read")
    # One shell for all, so that what one command sets is there for the next one, "$?" too.
    script = "".join(f"eval {shlex.quote(command)}\n{{ s=$?; printf '\\0'; (exit $s); }}\n"
                     for command, _, _ in wanted)
    environment = {name: value for name, value in os.environ.items() if not name.startswith("GIT_")}
    environment |= {f"GIT_{who}_{what}": value for who in ("AUTHOR", "COMMITTER") for what, value in
                    (("NAME", "Mara"), ("EMAIL", "mara@example.org"), ("DATE", "2024-05-01T12:00:00Z"))}
    with tempfile.TemporaryDirectory(prefix="document") as home:
        os.mkdir(work := f"{home}/work")
        environment |= {"HOME": home, "LC_ALL": "C.UTF-8", "TZ": "UTC", "GIT_CONFIG_NOSYSTEM": "1",
                        "GIT_PAGER": "cat", "PATH": f"{programs}:{os.environ['PATH']}"}
        run = subprocess.run(["bash", "-c", script], cwd=work, env=environment, stdin=subprocess.DEVNULL,
                             stdout=subprocess.PIPE, stderr=subprocess.STDOUT, timeout=TIME_LIMIT_SECONDS)
    outputs = run.stdout.decode("utf-8", "backslashreplace").split("\0")
    outputs += ["<the shell had ended>"] * (len(wanted) - len(outputs))
    failed = False
    for (command, output, place), got in zip(wanted, map(shown, outputs)):
        pattern = re.sub(r"(?m)^\\\.\\\.\\\.\\\n", r"(?:.*\\n)*", re.escape(shown(output)))
        if not re.fullmatch(pattern, got):
            line = text.count("\n", 0, place) + 1
            print(f"{document}:{line}: {command}\n--- wanted\n{shown(output)}--- got\n{got}")
            failed = True
    return failed


if __name__ == "__main__":
    sys.exit(any([check(os.path.abspath(sys.argv[1]), Path(name)) for name in sys.argv[2:]]))
