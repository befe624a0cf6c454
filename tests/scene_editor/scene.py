"""Scenes in the style that the engine writes: objects by file ID, fields as nested dicts, lists and texts."""

import functools
from collections import namedtuple

import yaml

HEADER = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n"
NONE = {"fileID": "0"}

# What parse() returns may be shared between scenes, and must not be changed.
Object = namedtuple("Object", "number name fields stripped")


def is_unit(value):
    """A reference, vector or colour: stands in braces, and means something only as a whole."""
    return isinstance(value, dict) and not value.keys().isdisjoint(("fileID", "x", "r"))


def target_of(value):
    """The object of this file that a value refers to, or None."""
    local = isinstance(value, dict) and "guid" not in value and value.get("fileID") not in (None, "0")
    return value["fileID"] if local else None


def local_references(value):
    if isinstance(value, (dict, list)):
        if target_of(value):
            yield target_of(value)
        for below in value.values() if isinstance(value, dict) else value:
            yield from local_references(below)


def transform_of(scene, game_object):
    parts = [entry["component"]["fileID"] for entry in scene[game_object].fields.get("m_Component", [])]
    return next((part for part in parts if part in scene and scene[part].name == "Transform"), None)


def owner_of(scene, file_id):
    """What an object is a part of or hangs below: "0" for nothing. It need not be there."""
    item = scene[file_id]
    if item.name == "GameObject" and not item.stripped:
        transform = transform_of(scene, file_id)
        return scene[transform].fields["m_Father"]["fileID"] if transform else "0"
    if item.name == "PrefabInstance":
        return item.fields["m_Modification"]["m_TransformParent"]["fileID"]
    return item.fields.get("m_PrefabInternal" if item.stripped else "m_GameObject", NONE)["fileID"]


def owners(scene, file_id):
    """The object itself and its owners, from the inside to the outside; a cycle is left at its beginning."""
    chain = []
    while file_id in scene and file_id not in chain:
        chain.append(file_id)
        file_id = owner_of(scene, file_id)
    return chain


def whole(scene, top):
    return [file_id for file_id in scene if top in owners(scene, file_id)]


@functools.lru_cache(maxsize=20000)
def _object(text):
    head, body = text.split("\n", 1)
    number, anchor, *stripped = head.split(" ")
    (name, fields), = yaml.load(body, Loader=yaml.CBaseLoader).items()
    return anchor[1:], Object(number, name, fields, stripped == ["stripped"])


def parse(text):
    """Anything that isn't such a scene is a ValueError or a yaml.YAMLError."""
    if not text.startswith(HEADER):
        raise ValueError("no header")
    items = [_object(part) for part in text[len(HEADER):].split("--- !v!")[1:]]
    if len(dict(items)) != len(items):
        raise ValueError("a file ID twice")
    return dict(items)


def _lines(value, indent, head):
    """The lines of a value behind `head`, which ends with a colon or a dash."""
    if is_unit(value):
        yield f"{head} {{{', '.join(f'{key}: {text}' for key, text in value.items())}}}"
    elif isinstance(value, dict):
        if head.endswith(":"):
            yield head
            head = f"{indent} "
        for key, below in value.items():
            yield from _lines(below, indent + "  ", f"{head} {key}:")
            head = f"{indent} "
    elif isinstance(value, list) and value:
        yield head
        for item in value:
            yield from _lines(item, indent, indent + "-")
    else:
        yield f"{head} {value or '[]'}"


def write(scene):
    lines = []
    for file_id, item in scene.items():
        lines.append(f"--- !v!{item.number} &{file_id}{' stripped' if item.stripped else ''}")
        lines += _lines(item.fields, "", item.name + ":")
    return HEADER + "\n".join(lines) + "\n"
