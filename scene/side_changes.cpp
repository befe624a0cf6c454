#include "scene/side_changes.h"

#include "scene/object_links.h"
#include "scene/same_fields.h"
#include "yaml/folded_object.h"

namespace vexel_yaml {

namespace {

bool IsSame(const YAMLNode& a, const YAMLNode& b) {
  if (&a == &b || HaveSameText(a, b)) return true;
  // Of two different texts in the written style only reading tells whether they mean the same.
  return GetFolded(&a) == nullptr && GetFolded(&b) == nullptr && a.EqualsByContent(&b);
}

// Whether all but the links of two mappings at `path` are the same.
bool HaveSameOwnFields(FieldPath& path, ObjectLinks::Kind kind, const YAMLMapping& a, const YAMLMapping& b) {
  const auto is_same_at = [&](const YAMLScalar* key) {
    path.push_back(key);
    const YAMLMapping* nested_a = a.Get(key) == nullptr ? nullptr : a.Get(key)->AsMapping();
    const YAMLMapping* nested_b = b.Get(key) == nullptr ? nullptr : b.Get(key)->AsMapping();
    const bool holds_father = kind == ObjectLinks::Kind::kPrefabInstance && path.size() == 3 &&
                              key == YAMLScalar::mModification && nested_a != nullptr && nested_b != nullptr;
    const bool is_same =
        IsLink(path, kind) || (holds_father ? HaveSameOwnFields(path, kind, *nested_a, *nested_b)
                                            : HaveSameFields(path, a.Get(key), b.Get(key)));
    path.pop_back();
    return is_same;
  };
  for (const auto& [key, value] : a) {
    if (!is_same_at(key)) return false;
  }
  for (const auto& [key, value] : b) {
    if (!a.HasKey(key) && !is_same_at(key)) return false;
  }
  return true;
}

}  // namespace

SideChanges FindChanges(const VexelObjects& base, const VexelObjects& side) {
  SideChanges changes;
  // Most objects stand where they stood: to look there first is far quicker than to look them up among all.
  auto next = side.begin();
  for (const auto& [file_id, object] : base) {
    const bool is_next = next != side.end() && (*next).key == file_id;
    const YAMLNode* other = is_next ? (*next).value : side.Get(file_id);
    if (other != nullptr) {
      while (next != side.end() && (*next).key != file_id) ++next;
      if (next != side.end()) ++next;
    }
    if (other == nullptr) {
      changes.removed.push_back(file_id);
      changes.kinds.emplace(file_id, SideChanges::Kind::kRemoved);
    } else if (!IsSame(*object, *other)) {
      changes.changed.push_back(file_id);
      changes.kinds.emplace(file_id, SideChanges::Kind::kChanged);
    }
  }
  if (base.Size() - changes.removed.size() == side.Size()) return changes;
  for (const auto& [file_id, object] : side) {
    if (base.HasKey(file_id)) continue;
    changes.added.push_back(file_id);
    changes.kinds.emplace(file_id, SideChanges::Kind::kAdded);
  }
  return changes;
}

bool IsEdited(const YAMLScalar* file_id, const YAMLNode* base, const YAMLNode* side) {
  const YAMLMapping* body = GetBody(base);
  const YAMLMapping* edited = GetBody(side);
  FieldPath path = {file_id};
  const ObjectLinks links = ReadLinks(base);
  if (body == nullptr || edited == nullptr || ReadLinks(side).body_key != links.body_key) {
    return !HaveSameFields(path, base, side);
  }
  path.push_back(links.body_key);
  return !HaveSameOwnFields(path, links.kind, *body, *edited);
}

}  // namespace vexel_yaml
