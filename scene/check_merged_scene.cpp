#include <algorithm>

#include "scene/object_links.h"
#include "scene/settle_scene.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// Clears the references of one object to others that the merged scene doesn't have any more.
class ReferenceRepair {
 public:
  ReferenceRepair(const SettledScene& settled, const VexelObjects& merged,
                  RecordingConflictResolver& resolver)
      : vanishing_(settled.vanishing), merged_(merged), resolver_(resolver) {}

  void Repair(const YAMLScalar* file_id, YAMLNode* object) {
    path_ = {file_id};
    is_repaired_ = false;
    Walk(object);
    if (is_repaired_) object->RebuildHash(false);
  }

 private:
  void Walk(YAMLNode* node) {
    if (node == nullptr) return;
    if (YAMLMapping* mapping = node->AsMapping()) {
      if (mapping->HasDuplicateKeys()) return;
      const YAMLScalar* target = GetLocalTarget(mapping);
      if (target != nullptr && vanishing_.contains(target) && !merged_.HasKey(target)) {
        Clear(*mapping);
        return;
      }
      for (const auto& [key, value] : *mapping) WalkAt(key, value);
    } else if (YAMLSequence* sequence = node->AsSequence()) {
      int index = 0;
      for (YAMLNode* item : sequence->GetItems()) WalkAt(YAMLScalar::Lookup(IntToString(index++)), item);
    }
  }

  void WalkAt(const YAMLScalar* key, YAMLNode* value) {
    path_.push_back(key);
    Walk(value);
    path_.pop_back();
  }

  void Clear(YAMLMapping& reference) {
    reference.Change(YAMLScalar::fileID, YAMLScalar::zero->AsValue());
    is_repaired_ = true;
    FieldPath path = path_;
    path.push_back(YAMLScalar::fileID);
    const Operation* change = YAMLAlloc<ChangeOperation>::create(YAMLScalar::zero);
    resolver_.AddRecord(
        {std::move(path), ConflictType::kLeftChanges, MergeResolve::kAutomatic, change, nullptr});
  }

  const std::unordered_set<const YAMLScalar*>& vanishing_;
  const VexelObjects& merged_;
  RecordingConflictResolver& resolver_;
  FieldPath path_;
  bool is_repaired_ = false;
};

}  // namespace

void CheckMergedScene(SettledScene& settled, VexelObjects& merged, RecordingConflictResolver& resolver) {
  const bool has_lost = std::ranges::any_of(
      settled.vanishing, [&](const YAMLScalar* file_id) { return !merged.HasKey(file_id); });
  if (has_lost) {
    ReferenceRepair repair(settled, merged, resolver);
    for (const YAMLScalar* file_id : settled.touched) repair.Repair(file_id, merged.Get(file_id));
  }
  for (SceneFault& fault : CheckScene(merged, settled.touched)) {
    if (settled.known_faults.contains(fault)) continue;
    settled.notes.push_back(fault.file_id->GetText() + ' ' + fault.text +
                            ": please repair this object by hand");
    resolver.AddRecord(
        {{fault.file_id}, ConflictType::kBothChange, MergeResolve::kConflict, nullptr, nullptr});
  }
}

}  // namespace vexel_yaml
