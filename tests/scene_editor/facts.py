"""What each side did, looked for in a merged scene: a walk over the versions, place by place."""

import itertools
from collections import Counter

from scene import NONE, is_unit, local_references, owners, target_of, whole

HANGS_ON = {"m_Father", "m_TransformParent", "m_GameObject"}
DERIVED = {"m_Children", "m_Component"}  # The other ends of m_Father and m_GameObject.


def _get(fields, key):
    """A field, or None; the overrides of a prefab instance by what they override, since their order means nothing."""
    value = fields.get(key) if isinstance(fields, dict) else None
    if key != "m_Modifications" or value is None:
        return value
    return {f"#{item['target']['fileID']} {item['propertyPath']}": item for item in value}


def _missing(path, base, side, other, merged):
    """The places below `path` where `side` differs from `base`, and `merged` doesn't show it."""
    if side == base or path[-1] in DERIVED:
        return
    if isinstance(side, dict) and not is_unit(side):
        for key in side.keys() | (base or {}).keys():
            yield from _missing((*path, key), *(_get(version, key) for version in (base, side, other, merged)))
    elif isinstance(side, list) and isinstance(merged, list):
        yield from _missing_in_list(path, base or [], side, (base or []) if other is None else other, merged)
    elif side != merged:
        yield path, side


def _missing_in_list(path, base, side, other, merged):
    found = False
    counts = [Counter(map(repr, version)) for version in (base, side, other, merged)]
    for text, item in {repr(item): item for item in base + side}.items():
        before, mine, theirs, after = (count[text] for count in counts)
        # The same done on both sides may be one or two edits.
        wanted = mine + theirs - before if (mine - before) * (theirs - before) < 0 else mine
        if after < wanted and mine > before or after > wanted and mine < before:
            found = True
            yield path, item
    if not found and slot_lost(base, side, other, merged):
        yield path, "slot"
    elif not found and (merged != side if other == base else order_lost(base, side, other, merged)):
        yield path, "order"


def _filled_slots(base, side):
    """What `side` put in the place of elements, by index, or None where it did anything else to the list."""
    filled = {n: item for n, item in enumerate(side) if base[n:n + 1] != [item]}
    return filled if len(side) == len(base) and not any(item in base for item in filled.values()) else None


def slot_lost(base, side, other, merged):
    """Whether one of the slots that `side` filled or took away, and nothing else, has something else in it."""
    filled, others = _filled_slots(base, side), _filled_slots(base, other)
    if filled is not None and others is not None:
        return any(merged[n:n + 1] != [item] for n, item in filled.items())
    takes_away = [item for item in base if item in side] == side
    # What was put into several slots may stand in another one.
    stays = [item for n, item in (others or {}).items() if base[n] in side]
    return takes_away and any(base[n] not in side and item in merged and item not in stays
                              for n, item in (others or {}).items())


def order_lost(base, side, other, merged):
    """Whether two elements that only `side` put the other way round still stand as they stood."""
    versions = [[repr(item) for item in version] for version in (base, side, other, merged)]
    at = [{item: place for place, item in enumerate(version)} for version in versions]
    if any(len(places) != len(version) for places, version in zip(at, versions)):
        return False
    common = [item for item in versions[0] if all(item in places for places in at)]
    before, mine, theirs, after = at
    return any(mine[a] > mine[b] and theirs[a] < theirs[b] and after[a] < after[b]
               for n, a in enumerate(common) for b in common[n + 1:])


def _children_reordered(before, after):
    lists = [item.fields.get("m_Children", []) for item in (before, after)]
    return [child for child in lists[0] if child in lists[1]] != [child for child in lists[1] if child in lists[0]]


def _without(value, gone):
    """A value without the entries of lists that are nothing but a reference to what is gone, or cleared as such."""
    if isinstance(value, list):
        return [_without(item, gone) for item in value if target_of(item) not in gone and not (gone and item == NONE)]
    return {key: _without(below, gone) for key, below in value.items()} if isinstance(value, dict) else value


def lost(base, side, other, merged):
    """Every edit from `base` to `side` that `merged` doesn't show, as (object, path, value)."""
    gone = (base.keys() | side.keys() | other.keys()) - merged.keys()
    for file_id in base.keys() | side.keys():
        items = [version.get(file_id) for version in (base, side, other, merged)]
        before, mine, _, after = items
        name = (mine or before).name
        if mine is None:
            if after is not None:
                yield file_id, (name,), None
        elif before is None or before is not mine:
            if after is None:
                if before is None or _children_reordered(before, mine) or any(
                        _missing((name,), before.fields, mine.fields, None, None)):
                    yield file_id, (name,), mine.fields
                continue
            for path, value in _missing((name,), *(item and _without(item.fields, gone) for item in items)):
                yield file_id, path, value
            if name == "Transform" and before and not mine.stripped:
                lists = [item.fields["m_Children"] if item else [] for item in items]
                if order_lost(*lists) or lists[0] == lists[2] and lists[1] != lists[3] and \
                        sorted(map(str, lists[1])) == sorted(map(str, lists[3])):
                    yield file_id, (name, "m_Children"), "order"


def left_behind(base, side, other, merged):
    """Objects that `side` deleted and that are there again, where something that `other` left alone referred to them
    and doesn't any more, as (object, target). What `side` put in the place of a reference is its own edit."""
    def clears(before, after, target):
        if isinstance(before, list) and isinstance(after, list):
            entry = {"fileID": target}
            # Among equal elements it can't be told which one went, unless nothing else did.
            is_clear = len(after) < len(before) and all(
                items.count(item) == 1 for items in (before, after) for item in items)
            is_all = after in ([item for item in before if item != entry],
                               [NONE if item == entry else item for item in before])
            return (is_clear or is_all) and entry in before and entry not in after
        if target_of(before) == target:
            return after == NONE
        return isinstance(before, dict) and isinstance(after, dict) and any(
            clears(below, after.get(key), target) for key, below in before.items() if key not in DERIVED | HANGS_ON)

    for file_id, before in base.items():
        mine, theirs, after = (version.get(file_id) for version in (side, other, merged))
        if mine and after and theirs is before and mine is not before:
            for target in set(local_references(before.fields)) & merged.keys() - side.keys():
                if clears(before.fields, mine.fields, target) and clears(before.fields, after.fields, target):
                    yield file_id, target


def is_covered(fact, base, side, other, pending):
    """Whether a pending path is the place of the edit, one inside it, or a thing that it is about."""
    file_id, path, value = fact
    three = (base, side, other)
    things = {part for version in three for part in owners(version, file_id)}
    deletes = value is None and len(path) == 1
    if deletes:
        # A deletion is one act with what it took along, and with what the other side put there.
        for deleted in (version for version in (side, other) if file_id not in version):
            top = [part for part in owners(base, file_id) if part not in deleted][-1]
            things |= {*whole(base, top), *whole(other, top)}
    # What it hung on may be elsewhere in another version.
    things |= {part for thing in things for version in three for part in owners(version, thing)}
    old = base[file_id].fields if file_id in base else {}
    for key in path[1:]:
        old = _get(old, key)
    targets = [target for target in (target_of(value), value == NONE and target_of(old)) if target]
    # What became of a slot goes with what filled it, and what it held comes back.
    new = side[file_id].fields if file_id in side else {}
    for key in path[1:]:
        new = _get(new, key)
    if isinstance(new, list):
        befores = old or []
        changed = [item for item in new if item not in befores]
        if value in (NONE, "slot"):
            changed = changed * (value != NONE) + [item for item in befores if item not in new]
        targets += filter(None, map(target_of, changed))
    if any(target not in side for target in targets):
        return True  # The editor cleared the reference, since its object was deleted.
    things |= {part for target in targets for version in three for part in owners(version, target)}
    place = (file_id, *itertools.takewhile(lambda key: not key.startswith("#"), path))
    for thing, *below in pending:
        # Where a thing hangs is a part of what becomes of the thing above.
        if thing in things and (not below or deletes and not HANGS_ON.isdisjoint(below)) or \
                below and all(a == b for a, b in zip(place, (thing, *below))):
            return True
    return False
