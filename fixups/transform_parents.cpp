#include "fixups/transform_parents.h"

#include "fixups/engine_keys.h"
#include "yaml/folded_object.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

YAMLMapping* GetFather(YAMLMapping& transform_object) {
  YAMLMapping* body = GetTransformBody(transform_object);
  return body == nullptr ? nullptr : GetSubmapping(*body, YAMLScalar::mFather);
}

}  // namespace

void TransformParents::Record(const YAMLScalar* transform, const YAMLScalar* parent, YAMLMapping* reference,
                              YAMLMapping* object) {
  links_[transform] = {parent, reference, object};
}

const YAMLScalar* TransformParents::GetParent(const YAMLScalar* transform) const {
  const auto found = links_.find(transform);
  if (found == links_.end()) return nullptr;
  return detached_.contains(found->second.reference) ? YAMLScalar::zero : found->second.parent;
}

void TransformParents::Detach(const YAMLScalar* transform) {
  Link& link = links_.at(transform);
  if (link.reference == nullptr) link.reference = GetFather(*link.object);
  YAMLMapping* reference = link.reference;
  reference->Change(YAMLScalar::fileID, YAMLScalar::zero->AsValue());
  detached_.insert(reference);
}

namespace {

// The object of the prefab that a transform without a parent of its own belongs to.
const YAMLScalar* FindPrefab(const YAMLMapping& body, const YAMLScalar* transform) {
  for (const YAMLScalar* key :
       {YAMLScalar::mPrefabInstance, YAMLScalar::mPrefabInternal, YAMLScalar::mPrefab}) {
    if (const YAMLScalar* prefab = GetMappingPath(body, key, YAMLScalar::fileID)) return prefab;
  }
  throw YAMLError("Could not determine the transform parent of " + transform->GetText());
}

// The reference with which a prefab object names the parent of its instance, null if it has none.
YAMLMapping* FindInstanceParent(YAMLMapping& prefab_object) {
  for (const YAMLScalar* key : {YAMLScalar::prefab, YAMLScalar::prefabInstance}) {
    YAMLMapping* body = GetSubmapping(prefab_object, key);
    YAMLMapping* modification = body == nullptr ? nullptr : GetSubmapping(*body, YAMLScalar::mModification);
    if (modification == nullptr ||
        GetMappingPath(*modification, YAMLScalar::mTransformParent, YAMLScalar::fileID) == nullptr) {
      continue;
    }
    return GetSubmapping(*modification, YAMLScalar::mTransformParent);
  }
  return nullptr;
}

const YAMLScalar* FileIDOf(const YAMLMapping* reference) {
  const YAMLNode* file_id = reference == nullptr ? nullptr : reference->Get(YAMLScalar::fileID);
  return file_id == nullptr ? nullptr : file_id->AsScalar();
}

}  // namespace

TransformParents RepairTransformParents(YAMLMapping& merged, const FileIDMap& left, const FileIDMap& right) {
  TransformParents parents;
  const auto is_removed = [&](const YAMLScalar* parent) {
    return !merged.HasKey(parent) && (left.Contains(parent) || right.Contains(parent));
  };
  for (const auto& [transform, value] : merged) {
    YAMLMapping* object = value->AsMapping();
    if (object == nullptr) continue;
    const FoldedObject* folded = object->GetFolded();
    const bool is_transform = folded != nullptr && (folded->body_key == YAMLScalar::transform ||
                                                    folded->body_key == YAMLScalar::rectTransform);
    if (is_transform && folded->father != nullptr && !is_removed(folded->father)) {
      parents.Record(transform, folded->father, nullptr, object);
      continue;
    }
    YAMLMapping* body = GetTransformBody(*object);
    if (body == nullptr) continue;
    const bool has_father = body->HasKey(YAMLScalar::mFather);
    YAMLMapping* reference = nullptr;
    if (has_father) {
      reference = GetSubmapping(*body, YAMLScalar::mFather);
    } else {
      YAMLNode* prefab = merged.Get(FindPrefab(*body, transform));
      if (prefab != nullptr && prefab->AsMapping() != nullptr)
        reference = FindInstanceParent(*prefab->AsMapping());
    }
    const YAMLScalar* parent = FileIDOf(reference);
    if (parent == nullptr) continue;
    if (has_father && is_removed(parent)) {
      reference->Change(YAMLScalar::fileID, YAMLScalar::zero->AsValue());
    }
    // The parent as read, even where it has just been cleared: whoever walks up from here meets the gap.
    parents.Record(transform, parent, reference, object);
  }
  return parents;
}

}  // namespace vexel_yaml
