"""Objects with one long list, in three versions."""

import random

HEADER = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n--- !v!114 &1140001\nMonoBehaviour:\n  entries:\n"


def object_with(elements):
    return HEADER + "".join(f"  - {element}\n" for element in elements)


def keyed(count):
    """Left shuffles the references, right removes, adds and edits some of them."""
    generator = random.Random(1)
    base = [(1_000_000 + 2 * i, generator.randrange(10)) for i in range(count)]
    left = generator.sample(base, count)
    right = []
    for i, (file_id, kind) in enumerate(base):
        if i % 100 != 7:
            right.append((file_id, kind + 10 if i % 10 == 3 else kind))
        if i % 100 == 50:
            right.append((file_id + 1, kind))
    return [[f"{{fileID: {file_id}, type: {kind}}}" for file_id, kind in side] for side in (base, left, right)]


def equal(count):
    """One value throughout; each side replaces the elements at the ends by two of its own."""
    def version(ends):
        return [f"{{size: {ends}}}"] + ["{size: 1}"] * (count - 2) + [f"{{size: {ends + 1}}}"]
    return [version(ends) for ends in (10, 20, 30)]


def unequal(count):
    """No value twice, and none that is left as it was."""
    return [[f"{{size: {i + shift}}}" for i in range(count)] for shift in (0, count, 2 * count)]


def versions(kind, count):
    """The texts of base, left and right."""
    return [object_with(elements) for elements in {"keyed": keyed, "equal": equal, "unequal": unequal}[kind](count)]
