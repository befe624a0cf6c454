"""What must hold for every merge of three sound scenes, whatever was edited."""

import itertools
import re
import subprocess
from pathlib import Path

import yaml

import facts
from scene import NONE, Object, owners, parse, whole, write
from soundness import faults

SIDES = ("left", "right")


class Broken(Exception):
    """A law that doesn't hold: its name, and what was seen."""


class Merger:
    """Runs the program in a folder of its own."""

    def __init__(self, program, folder, safe=True):
        self.command = [program, "merge", *["--safe"] * safe, "-h", "--fallback", "none", "-o", "records"]
        self.folder = Path(folder)

    def merge(self, *names, choices=None):
        """Merges files of the folder. Returns the scene and the pending paths, each split at its dots."""
        (self.folder / "choices").write_text("Conflict handling:\n" + "".join(
            f"{side} {'.'.join(path)}\n" for path, side in (choices or {}).items()))
        done = subprocess.run([*self.command, "-i", "choices", *(name + ".vexel" for name in (*names, "merged"))],
                              cwd=self.folder, capture_output=True, check=False, timeout=60)
        if done.returncode not in (0, 2):
            raise Broken("status", f"{done.returncode}: {done.stderr.decode('utf-8', 'replace').strip()}")
        conflicts = (self.folder / "records").read_text().split("Conflict handling:")[0]
        pending = dict.fromkeys(tuple(path.split(".")) for path in re.findall(r"^(?:Left|Right) +(\S+)", conflicts, re.M))
        if bool(pending) != (done.returncode == 2):
            raise Broken("status", f"{done.returncode} with the conflicts {list(pending)}")
        try:
            return parse((self.folder / "merged.vexel").read_text()), list(pending)
        except (ValueError, yaml.YAMLError) as error:
            raise Broken("readable", str(error)) from error


def check_edits(law, versions, merged, pending_for):
    """`pending_for`: by side, the paths at which that side's edits need not be in the result."""
    try:
        wrong = faults(merged)
    except (LookupError, AttributeError, TypeError) as error:
        wrong = [f"a field that every object of its class has is missing or another one: {error!r}"]
    if wrong:
        raise Broken(f"{law}: sound", "; ".join(wrong))
    for side, other in (SIDES, SIDES[::-1]):
        three = [versions[name] for name in ("base", side, other)]
        for fact in facts.lost(*three, merged):
            if not facts.is_covered(fact, *three, pending_for[side]):
                raise Broken(f"{law}: lost", f"{side}: {fact}; pending: {list(pending_for[side])}")
        for file_id, target in facts.left_behind(*three, merged):
            raise Broken(f"{law}: left behind", f"{file_id} no longer refers to {target}, which {side} deleted")


def settle(law, merger, versions, pending, choose):
    """Settles what is pending in two rounds, and looks for all that was chosen."""
    choices = {path: choose(path) for path in pending}
    merged, pending = merger.merge("base", "left", "right", choices=choices)
    # What is pending again contradicts another choice, and one of three must go with that.
    again = pending
    for words in itertools.islice(itertools.product(("base", *SIDES), repeat=len(again)), 81) if pending else ():
        choices.update(zip(again, words))
        merged, pending = merger.merge("base", "left", "right", choices=choices)
        if not pending:
            break
    if pending:
        raise Broken(f"{law}: rounds", f"pending {pending} with the choices {choices}")
    check_edits(law, versions, merged, {side: [path for path, chosen in choices.items() if chosen != side]
                                        for side in SIDES})
    for path, chosen in choices.items():
        # Choices for other things may bring something into a thing, or take something out.
        compared = chosen == "base" and (len(path) > 1 or len(set(choices.values())) == 1)
        if compared and not stands_as_in_base(versions, merged, path):
            raise Broken(f"{law}: base", f"{path} isn't as in base")


def value_at(scene, path):
    value = scene[path[0]].fields if path[0] in scene else None
    for key in path[2:]:
        value = value.get(key) if isinstance(value, dict) else None
    return value


def stands_as_in_base(versions, merged, path):
    """Whether a field has its value, and a thing its parts, apart from what somebody moved out, with all below it."""
    if path[0] not in versions["base"]:
        return True
    if len(path) == 1:
        top, sides = path[0], [versions[side] for side in SIDES]
        moved = {part for side in sides for part in side if top not in owners(side, part)}
        parts = [{part for part in whole(scene, top) if moved.isdisjoint(
            itertools.takewhile(top.__ne__, owners(scene, part)))} for scene in (versions["base"], merged)]
        return parts[0] == parts[1]
    before, after = (value_at(scene, path) for scene in (versions["base"], merged))
    if isinstance(before, list):  # Its order is what the choice is about; what only one side added is there, too.
        before, after = ([item for item in one if item in two and item != NONE]
                         for one, two in ((before, after), (after, before)))
    # A reference to what is gone is cleared, whatever was chosen for it.
    return before is None or before == after or path[-1] == "fileID" and before not in merged


def _without_order(value):
    if isinstance(value, list):
        return sorted(map(_without_order, value), key=repr)
    if isinstance(value, Object):
        return value.name, value.stripped, _without_order(value.fields)
    return {key: _without_order(below) for key, below in value.items()} if isinstance(value, dict) else value


def check_swapped(merger, versions, merged, pending):
    if any(value_at(versions["base"], path) is None for path in pending):
        return  # Left's value stands where both added one until somebody chooses.
    swapped, swapped_pending = merger.merge("base", "right", "left")
    different = [file_id for file_id in merged.keys() | swapped.keys()
                 if _without_order(merged.get(file_id)) != _without_order(swapped.get(file_id))]
    if different or len(pending) != len(swapped_pending):
        raise Broken("swapped", f"{different} differ, {pending} is pending, and then {swapped_pending}")


def check_trivial(merger, versions):
    for names, wanted in ((("base", "left", "left"), "left"), (("base", "left", "base"), "left"),
                          (("base", "base", "right"), "right")):
        merged, pending = merger.merge(*names)
        if pending or list(merged.items()) != list(versions[wanted].items()):
            raise Broken("trivial", f"{' '.join(names)} isn't {wanted}; pending: {pending}")


def check(merger, versions, rng, thorough):
    """The laws for base, left and right, those about other merges only where `thorough` says so. Returns the number
    of conflicts."""
    texts = {name: write(scene) for name, scene in versions.items()}
    for name, text in texts.items():
        (merger.folder / f"{name}.vexel").write_text(text)
    # As they come back, so that equal objects are the same ones.
    versions = {name: parse(text) for name, text in texts.items()}
    assert not any(map(faults, versions.values())), [faults(scene) for scene in versions.values()]
    merged, pending = merger.merge("base", "left", "right")
    check_edits("merge", versions, merged, dict.fromkeys(SIDES, pending))
    if thorough:
        check_swapped(merger, versions, merged, pending)
        check_trivial(merger, versions)
    if pending:
        for how in ("left", "right", "base"):
            settle(f"all {how}", merger, versions, pending, lambda path, side=how: side)
        settle("random", merger, versions, pending, lambda path: rng.choice(("left", "right", "base")))
    return len(pending)
