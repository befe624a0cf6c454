#!/usr/bin/env -S python3 -B
"""reference_lists.py <program> [--base IDS] [--ids N] [--longest N]

Merges every two edits of a list of references with --safe, and looks at what came out: a list without a rule may be
a set or a row of slots, so a merge that records nothing must be right either way. 0 is an empty slot.
"""

import argparse
import itertools
import os
import re
import subprocess
import sys
import tempfile
from pathlib import Path

HEADER = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n"
FIRST = 1000


def lists(ids, longest):
    """All lists in which nothing but 0 stands twice."""
    for size in range(longest + 1):
        for items in itertools.product(range(ids + 1), repeat=size):
            filled = [item for item in items if item]
            if len(set(filled)) == len(filled):
                yield list(items)


def write(path, ids, every):
    script = "--- !v!114 &{}\nMonoBehaviour:\n  {}\n".format
    texts = [script(file_id, "a: 1") for file_id in range(1, ids + 1)]
    for number, items in enumerate(every, FIRST):
        entries = "".join(f"\n  - {{fileID: {item}}}" for item in items)
        texts.append(script(number, f"f:{entries or ' []'}"))
    path.write_text(HEADER + "".join(texts))


def merge(program, folder, choices=()):
    """The merged lists, and the paths of what is pending, a list for each."""
    (folder / "choices").write_text("Conflict handling:\n" + "".join(f"{choice}\n" for choice in choices))
    done = subprocess.run(
        [program, "merge", "--safe", "-h", "--fallback", "none", "-i", "choices", "-o", "records",
         *(f"{name}.vexel" for name in ("base", "left", "right", "merged"))],
        cwd=folder, capture_output=True, check=False)
    if done.returncode not in (0, 2):
        sys.exit(f"status {done.returncode}: {done.stderr.decode('utf-8', 'replace')}")
    records = (folder / "records").read_text().split("Conflict handling:")[0]
    pending = {}
    for path in re.findall(r"^Left +(\S+)", records, re.M):
        pending.setdefault(int(path.split(".")[0]), []).append(path)
    bodies = (folder / "merged.vexel").read_text().split("--- !v!114 &")
    merged = {int(body.split("\n")[0]): [int(item) for item in re.findall(r"fileID: (\d+)", body)] for body in bodies[1:]}
    return merged, pending


def lost(base, side, other, merged):
    """What of one side's edit isn't there, where the other side's edit must be there, too."""
    if any(item in merged for item in base if item and item not in side):
        yield "removal"
    if any(merged.count(item) != 1 for item in side if item and item not in base):
        yield "addition"
    kept = [item for item in base if item and item in side and item in other]
    if any(item not in merged for item in kept):
        return (yield "element that both kept")
    is_unmoved = [item for item in other if item and item in base] == [item for item in base if item and item in other]
    for a, b in itertools.combinations(kept, 2):
        if side.index(a) > side.index(b) and merged.index(a) < merged.index(b):
            yield "order"
    for a, b in itertools.product([item for item in side if item and item not in base], kept):
        if is_unmoved and a in merged and (side.index(a) < side.index(b)) != (merged.index(a) < merged.index(b)):
            yield "place"


def by_index(base, left, right):
    """Three lists of one length as rows of slots; None where both filled one."""
    merged = [b if l == r == b else r if l == b else l for b, l, r in zip(base, left, right)]
    return None if any(b != l != r != b for b, l, r in zip(base, left, right)) else merged


def faults(base, left, right, merged, is_pending):
    for side, same in ((left, base == right or left == right), (right, base == left)):
        if same:
            return ["one-sided edit"] if is_pending or merged != side else []
    if is_pending:
        return []
    found = [*lost(base, left, right, merged), *lost(base, right, left, merged)]
    if len(base) == len(left) == len(right) and by_index(base, left, right) != merged:
        found.append("slot")
    return found


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("program", type=os.path.abspath)
    parser.add_argument("--base", default="102")
    parser.add_argument("--ids", type=int, default=4)
    parser.add_argument("--longest", type=int, default=3)
    options = parser.parse_args()
    base = [int(digit) for digit in options.base]
    pairs = list(itertools.product(lists(options.ids, options.longest), repeat=2))
    with tempfile.TemporaryDirectory() as name:
        folder = Path(name)
        for version, every in (("base", [base] * len(pairs)), ("left", [left for left, _ in pairs]),
                               ("right", [right for _, right in pairs])):
            write(folder / f"{version}.vexel", options.ids, every)
        merged, pending = merge(options.program, folder)
        wrong = [(what, left, right, merged[number]) for number, (left, right) in enumerate(pairs, FIRST)
                 for what in faults(base, left, right, merged[number], number in pending)]
        for side in (0, 1):
            word = ("left", "right")[side]
            settled, again = merge(options.program, folder, [f"{word} {path}" for paths in pending.values() for path in paths])
            wrong += [(f"{word} chosen: pending", *pairs[number - FIRST], settled[number]) for number in again]
            for number in pending:
                versions = pairs[number - FIRST]
                wrong += [(f"{word} chosen: {what}", *versions, settled[number]) for what in
                          lost(base, versions[side], base, settled[number]) if what in ("removal", "addition")]
    for what, left, right, items in wrong[:20]:
        print(f"{what}: {base}, left {left}, right {right} became {items}")
    print(f"{len(pairs)} merges of {base}, {len(pending)} with conflicts, {len(wrong)} faults")
    return 1 if wrong else 0


if __name__ == "__main__":
    sys.exit(main())
