"""What people do to a scene in the editor. Each edit leaves the scene sound, as the editor does: its own lists
follow, and references to what is gone are cleared."""

import hashlib
import pickle

from scene import NONE, Object, local_references, owner_of, owners, target_of, transform_of, whole

NUMBERS = {"Light": 108, "MeshRenderer": 23, "BoxCollider": 65, "MonoBehaviour": 114}
FIELDS = {"GameObject": ("m_Name", "m_Layer"), "Transform": ("m_LocalPosition",), "MeshRenderer": ("m_Enabled",),
          "BoxCollider": ("m_Size",), "Light": ("m_Intensity", "m_Color", "m_Shadows.m_Type", "m_Shadows.m_Strength"),
          "MonoBehaviour": ("speed", "target", "settings.gust", "settings.calm", "notes")}
LISTS = {"MeshRenderer": ("m_Materials",), "MonoBehaviour": ("waves", "delays", "lamps")}
BUILDING = {"add": 8, "add_instance": 2, "add_component": 8, "override": 2, "insert": 4, "set_field": 4, "move": 1}
EDITING = {"add": 3, "add_instance": 1, "add_component": 3, "remove_component": 2, "delete": 4, "duplicate": 1,
           "move": 5, "override": 3, "revert_override": 1, "set_field": 8, "drop_field": 1,
           "insert": 3, "remove": 2, "replace": 6, "shift": 4}


def _clear(value, gone):
    for key, below in value.items() if isinstance(value, dict) else enumerate(value):
        if isinstance(below, list):
            below[:] = [item for item in below if target_of(item) not in gone]
        if target_of(below) in gone:
            value[key] = NONE
        elif isinstance(below, (dict, list)):
            _clear(below, gone)


class Editor:
    """One edit of a scene. What it chooses depends on its number and on what there is to choose from, and mostly
    stays the same when edits before it are left out. Where there is nothing to choose, a ValueError says so, and
    the scene is as it was."""

    def __init__(self, scene, number):
        self.scene, self.number, self.picks = scene, number, 0

    def _pick(self, candidates):
        self.picks += 1
        return min(candidates, key=lambda candidate: hashlib.md5(
            f"{candidate} {self.number} {self.picks}".encode()).digest())

    def _index(self, items):
        return self._pick(range(len(items)))

    def _any(self, name, stripped=True):
        return self._pick([file_id for file_id, item in self.scene.items() if item.name == name and
                           (stripped or not item.stripped)])

    def _father(self, above=None):
        """A transform that isn't too deep and not below another, or now and then the top."""
        fitting = [file_id for file_id, item in self.scene.items() if item.name == "Transform" and
                   len(owners(self.scene, file_id)) <= 10 and above not in owners(self.scene, file_id)]
        return self._pick([*fitting[-8:], "0"])

    def _children(self, transform):
        """Those of the top and below prefab instances are listed nowhere."""
        return self.scene[transform].fields.get("m_Children", []) if transform in self.scene else []

    def _put_below(self, transform, father):
        children = self._children(father)
        children.insert(self._index([*children, None]), {"fileID": transform})

    def _value(self, old):
        if old is None or isinstance(old, str):
            return self._pick("0123456789" if not old or old.isdigit() else ("Crate", "Lamp", "Pier", "Door", "Gull"))
        if "guid" in old:
            return old | {"guid": "a" + self._pick("0123456789")}
        if "fileID" in old:
            return {"fileID": self._pick([*self.scene, "0"])}
        keys = [self._pick(old)] if "x" in old or "r" in old or self._pick((0, 1)) else list(old)
        return old | {key: self._value(old[key]) for key in keys}

    def _new(self, file_id, number, name, fields, stripped=False):
        self.scene[file_id] = Object(number, name, fields, stripped)

    def _ids(self):
        first = self.number * 100
        if str(first) in self.scene:
            raise ValueError
        return map(str, range(first, first + 100))

    def add(self):
        (game_object, transform, *_), father, name = self._ids(), self._father(), self._value("name")
        self._new(game_object, 1, "GameObject", {"m_Component": [{"component": {"fileID": transform}}],
                                                 "m_Layer": "0", "m_Name": name})
        self._new(transform, 4, "Transform", {"m_GameObject": {"fileID": game_object}, "m_LocalPosition": {
            "x": "0", "y": "0", "z": "0"}, "m_Children": [], "m_Father": {"fileID": father}})
        self._put_below(transform, father)

    def add_instance(self):
        (instance, transform, game_object, *_), father = self._ids(), self._father()
        self._new(instance, 1001, "PrefabInstance", {"m_Modification": {
            "m_TransformParent": {"fileID": father}, "m_Modifications": []}})
        self._new(transform, 4, "Transform", {"m_PrefabInternal": {"fileID": instance}}, True)
        self._new(game_object, 1, "GameObject", {"m_PrefabInternal": {"fileID": instance}}, True)
        self._put_below(transform, father)

    def add_component(self):
        (component, *_), game_object, kind = self._ids(), self._any("GameObject"), self._pick(NUMBERS)
        own = {"Light": {"m_Color": {"r": "1", "g": "1", "b": "1", "a": "1"}, "m_Intensity": "2",
                         "m_Shadows": {"m_Type": "2", "m_Strength": "1"}},
               "MeshRenderer": {"m_Materials": [{"fileID": "2100000", "guid": f"a{n}", "type": "2"} for n in (1, 2)]},
               "BoxCollider": {"m_Size": {"x": "1", "y": "1", "z": "1"}},
               "MonoBehaviour": {"speed": "1", "target": NONE, "settings": {"gust": "1", "calm": "0"},
                                 "lamps": [self._value(NONE) for _ in range(3)],
                                 "delays": ["1", "2", "3"], "waves": [{"name": name, "wait": "3", "count": "1"}
                                                                      for name in ("ship", "gull", "rain")]}}[kind]
        self._new(component, NUMBERS[kind], kind, {"m_GameObject": {"fileID": game_object}, "m_Enabled": "1", **own})
        self.scene[game_object].fields.get("m_Component", []).append({"component": {"fileID": component}})

    def _remove(self, gone):
        for file_id in gone:
            del self.scene[file_id]
        for item in self.scene.values():
            if not gone.isdisjoint(local_references(item.fields)):
                item.fields["m_Component"] = [entry for entry in item.fields.get("m_Component", [])
                                              if target_of(entry["component"]) not in gone]
                if item.name != "GameObject" or item.stripped:
                    del item.fields["m_Component"]
                _clear(item.fields, gone)

    def remove_component(self):
        self._remove({self._pick([file_id for file_id, item in self.scene.items() if item.name in NUMBERS])})

    def delete(self):
        """A game object or prefab instance, with everything below it."""
        tops = ("GameObject",) * 4 + ("PrefabInstance",)
        self._remove(set(whole(self.scene, self._any(self._pick(tops), stripped=False))))

    def duplicate(self):
        new_ids, top = self._ids(), self._any("GameObject", stripped=False)
        names, transform = dict(zip(whole(self.scene, top), new_ids)), transform_of(self.scene, top)

        def renamed(value):
            if isinstance(value, dict):
                return {"fileID": names.get(value["fileID"], value["fileID"])} if target_of(value) else {
                    key: renamed(below) for key, below in value.items()}
            return [renamed(below) for below in value] if isinstance(value, list) else value

        siblings = self._children(owner_of(self.scene, top))
        for old, new in names.items():
            self.scene[new] = self.scene[old]._replace(fields=renamed(self.scene[old].fields))
        siblings.insert(siblings.index({"fileID": transform}) + 1 if siblings else 0, {"fileID": names[transform]})

    def move(self):
        transform = self._any("Transform")
        owner = owner_of(self.scene, transform)
        father, old = self._father(above=owner), self._children(owner_of(self.scene, owner))
        if old:
            old.remove({"fileID": transform})
        fields = self.scene[owner].fields.get("m_Modification") or self.scene[transform].fields
        fields["m_TransformParent" if "m_TransformParent" in fields else "m_Father"] = {"fileID": father}
        self._put_below(transform, father)

    def _overrides(self):
        return self.scene[self._any("PrefabInstance")].fields["m_Modification"]["m_Modifications"]

    def override(self):
        overrides, reference = self._overrides(), self._value(NONE) if self._pick(range(5)) == 0 else NONE
        new = {"target": {"fileID": self._pick("123"), "guid": "e1", "type": "2"}, "propertyPath":
               self._pick(("m_Name", "speed")), "value": self._value("1"), "objectReference": reference}
        same = [entry for entry in overrides if all(entry[key] == new[key] for key in ("target", "propertyPath"))]
        overrides.append(new) if not same else same[0].update(new)

    def revert_override(self):
        overrides = self._overrides()
        del overrides[self._index(overrides)]

    def set_field(self):
        file_id, path = self._pick([(file_id, path) for file_id, item in self.scene.items() if not item.stripped
                                    for path in FIELDS.get(item.name, ())])
        fields, (*above, key) = self.scene[file_id].fields, path.split(".")
        for step in above:
            fields = fields.get(step, {})
        fields[key] = self._value(fields.get(key))

    def drop_field(self):
        fields = self.scene[self._any("MonoBehaviour")].fields
        del fields[self._pick(fields.keys() & {"speed", "notes", "settings", "waves"})]

    def _list(self, places, least=0):
        """A list of so many elements or more."""
        file_id, name = self._pick([(file_id, name) for file_id, item in self.scene.items()
                                    for name in places.get(item.name, ()) if len(item.fields.get(name, ())) >= least])
        return self.scene[file_id].fields.setdefault(name, [])

    def _new_item(self, items):
        item = self._value(items[self._index(items)] if items else NONE)
        if target_of(item) and item in items:
            raise ValueError
        return item

    def insert(self):
        items = self._list(LISTS)
        items.insert(self._index([*items, None]), self._new_item(items))

    def remove(self):
        items = self._list(LISTS, 1)
        del items[self._index(items)]

    def replace(self):
        items = self._list(LISTS, 1)
        items[self._index(items)] = self._new_item(items)

    def shift(self):
        items = self._list({**LISTS, "Transform": ("m_Children",)}, 2)
        items.insert(self._index(items), items.pop(self._index(items)))


def _edited(scene, series):
    for kind, number in series:
        try:
            getattr(Editor(scene, number), kind)()
        except ValueError:
            pass
    return scene


def build(base, left, right):
    """The three scenes after series of edits, which are pairs of a kind and a number."""
    start = _edited({"1": Object(104, "RenderSettings", {"m_Fog": "1", "m_Sun": NONE}, False)}, base)
    return {"base": start, **{name: _edited(pickle.loads(pickle.dumps(start)), series)
                              for name, series in (("left", left), ("right", right))}}


def make_triple(rng, edit_count):
    """Three series of edits: from nothing to the base, from there to the left, and to the right."""
    def draw(weights, count, first):
        return list(zip(rng.choices(list(weights), list(weights.values()), k=count), range(first, first + count)))

    base = draw(BUILDING, rng.randint(4, 40), 1)
    left, right = (draw(EDITING, rng.randint(1, edit_count), first) for first in (1000, 2000))
    if rng.random() < 0.2:
        right = left[:rng.randint(1, len(left))] + right  # As after a cherry-pick.
    return base, left, right
