#include "fixups/prefab_repairs.h"

#include <vector>

#include "fixups/engine_keys.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

void RemoveObjects(YAMLMapping& root, const std::vector<const YAMLScalar*>& file_ids) {
  for (const YAMLScalar* file_id : file_ids) root.Remove(file_id);
}

// Walks a file and sanitizes its prefab-internal references.
class PostProcessVisitor final : public YAMLNodeVisitor {
 public:
  explicit PostProcessVisitor(const FileIDMap& objects) : objects_(objects) {}

  void Visit(const YAMLScalar& /*scalar*/) override {}

  void Visit(YAMLMapping& mapping) override {
    const bool is_prefab_reference = key_ == YAMLScalar::mPrefabInternal;
    for (const auto& [key, value] : mapping) {
      if (is_prefab_reference && key == YAMLScalar::fileID && value->AsScalar() != nullptr) {
        SanitizePrefabInteralReferences(mapping, value->AsScalar());
      } else {
        VisitAt(key, value);
      }
    }
  }

  void Visit(YAMLSequence& sequence) override {
    for (YAMLNode* item : sequence.GetItems()) {
      // An index stands in the path between the key and the element.
      if (item != nullptr) VisitAt(nullptr, item);
    }
  }

  void VisitObject(YAMLNode& object) { VisitAt(nullptr, &object); }

  // Whether a reference was cleared since the last question.
  bool TakeCleared() { return std::exchange(cleared_, false); }

 private:
  void VisitAt(const YAMLScalar* key, YAMLNode* value) {
    key_ = key;
    value->Accept(*this);
  }

  void SanitizePrefabInteralReferences(YAMLMapping& reference, const YAMLScalar* file_id) {
    if (IsNullReference(file_id) || objects_.Contains(file_id)) return;
    reference.Change(YAMLScalar::fileID, YAMLScalar::zero->AsValue());
    cleared_ = true;
  }

  const FileIDMap objects_;
  // The key under which the node being visited stands.
  const YAMLScalar* key_ = nullptr;
  bool cleared_ = false;
};

}  // namespace

void RepairOrphanedPrefabTransforms(YAMLMapping& merged, const FileIDMap& left, const FileIDMap& right) {
  const FileIDMap objects = CollectFileIDMap(merged);
  std::vector<const YAMLScalar*> orphans;
  for (const auto& [file_id, value] : merged) {
    if (SurelyRefersToNoPrefab(*value)) continue;
    YAMLMapping* body = value->AsMapping() == nullptr ? nullptr : GetTransformBody(*value->AsMapping());
    if (body == nullptr) continue;
    const YAMLScalar* prefab = GetMappingPath(*body, YAMLScalar::mPrefabInternal, YAMLScalar::fileID);
    if (IsNullReference(prefab) || objects.Contains(prefab)) continue;
    if (!left.Contains(prefab) && !right.Contains(prefab)) continue;
    const YAMLScalar* game_object = GetMappingPath(*body, YAMLScalar::mGameObject, YAMLScalar::fileID);
    if (!IsNullReference(game_object) && objects.Contains(game_object)) {
      GetSubmapping(*body, YAMLScalar::mPrefabInternal)
          ->Change(YAMLScalar::fileID, YAMLScalar::zero->AsValue());
    } else {
      orphans.push_back(file_id);
    }
  }
  RemoveObjects(merged, orphans);
}

void ClearDanglingPrefabReferences(YAMLMapping& merged) {
  std::vector<const YAMLScalar*> removed;
  PostProcessVisitor visitor(CollectFileIDMap(merged));
  for (const auto& [file_id, value] : merged) {
    if (SurelyRefersToNoPrefab(*value)) continue;
    visitor.VisitObject(*value);
    if (!visitor.TakeCleared()) continue;
    YAMLMapping* object = value->AsMapping();
    if (object != nullptr && GetTransformBody(*object) != nullptr &&
        object->HasKey(YAMLScalar::strippedPrefabPlaceHolderName)) {
      removed.push_back(file_id);
    }
  }
  RemoveObjects(merged, removed);
}

}  // namespace vexel_yaml
