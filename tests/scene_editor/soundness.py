"""Whether a scene is one that the editor could have written."""

from collections import defaultdict

from scene import local_references, owners, target_of


def faults(scene):
    """What is wrong, a line each."""
    parts, below, found = defaultdict(list), defaultdict(list), []
    for file_id, item in scene.items():
        parts[target_of(item.fields.get("m_GameObject"))].append(file_id)
        if item.name == "Transform":
            below["".join(owners(scene, file_id)[2:3])].append(file_id)

    def expect(condition, what):
        found.extend([] if condition else [f"{file_id} {what}"])

    def name(reference):
        return scene[reference["fileID"]].name if reference["fileID"] in scene else None

    def lists(what, entries, actual):
        entries = list(map(target_of, entries))
        expect(sorted(entries, key=str) == sorted(actual), f"lists the {what} {entries}, and has {actual}")

    for file_id, item in scene.items():
        for target in local_references(item.fields):
            expect(target in scene, f"refers to {target}, which isn't there")
        if item.stripped:
            expect(name(item.fields["m_PrefabInternal"]) == "PrefabInstance", "is of no prefab instance")
        elif item.name == "GameObject":
            lists("components", [entry["component"] for entry in item.fields["m_Component"]], parts[file_id])
            expect([scene[part].name for part in parts[file_id]].count("Transform") == 1, "has not one transform")
        elif item.name == "PrefabInstance":
            father = item.fields["m_Modification"]["m_TransformParent"]
            expect(name(father) in ("Transform", None), "hangs below something that is no transform")
        elif "m_GameObject" in item.fields:
            expect(name(item.fields["m_GameObject"]) == "GameObject", "is a component of nothing")
        if item.name == "Transform" and not item.stripped:
            lists("children", item.fields["m_Children"], below[file_id])
            expect(name(item.fields["m_Father"]) in ("Transform", None), "hangs below something that is no transform")
            expect(len(owners(scene, owners(scene, file_id)[-1])) == 1, "is in a cycle")
    return found
