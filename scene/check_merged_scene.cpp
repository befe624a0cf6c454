#include <algorithm>
#include <iterator>
#include <unordered_set>
#include <vector>

#include "fixups/reference_search.h"
#include "platform/thread.h"
#include "scene/object_links.h"
#include "scene/settle_scene.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// A scene that lives with its faults is merged day after day.
constexpr size_t kMostNamed = 10;

// Clears the references of one object to others that the merged scene doesn't have any more.
class ReferenceRepair {
 public:
  ReferenceRepair(const SettledScene& settled, const VexelObjects& merged,
                  RecordingConflictResolver& resolver)
      : vanishing_(settled.vanishing), merged_(merged), resolver_(resolver) {}

  /// Returns whether there was something to repair.
  bool Repair(const YAMLScalar* file_id, YAMLNode* object) {
    path_ = {file_id};
    is_repaired_ = false;
    Walk(object);
    if (is_repaired_) object->RebuildHash(false);
    return is_repaired_;
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

// The objects that may refer to one of some others. Also those that nobody touched: a side may have left a
// reference behind.
std::vector<YAMLMapping::Slot> FindReferring(const ReferenceSearch& search, const VexelObjects& objects,
                                             bool threads) {
  std::vector<YAMLMapping::Slot> all;
  all.reserve(objects.Size());
  for (const YAMLMapping::Slot& slot : objects) all.push_back(slot);
  const auto middle = all.begin() + static_cast<ptrdiff_t>(threads ? all.size() / 2 : 0);
  const auto may_refer = [&](const YAMLMapping::Slot& slot) { return search.MayRefer(*slot.value); };
  std::vector<YAMLMapping::Slot> referring;
  std::vector<YAMLMapping::Slot> in_second_half;
  RunBoth(
      threads, [&] { std::copy_if(all.begin(), middle, std::back_inserter(referring), may_refer); },
      [&] { std::copy_if(middle, all.end(), std::back_inserter(in_second_half), may_refer); });
  referring.insert(referring.end(), in_second_half.begin(), in_second_half.end());
  return referring;
}

}  // namespace

void CheckMergedScene(SettledScene& settled, const VexelObjects& base, VexelObjects& merged,
                      RecordingConflictResolver& resolver, bool threads) {
  std::vector<const YAMLScalar*> lost;
  std::ranges::copy_if(settled.vanishing, std::back_inserter(lost),
                       [&](const YAMLScalar* file_id) { return !merged.HasKey(file_id); });
  std::unordered_set<const YAMLScalar*> differing(settled.touched.begin(), settled.touched.end());
  if (!lost.empty()) {
    ReferenceRepair repair(settled, merged, resolver);
    const ReferenceSearch search(lost);
    for (const auto& [file_id, object] : FindReferring(search, merged, threads)) {
      if (repair.Repair(file_id, object)) differing.insert(file_id);
    }
  }
  const SameAsIn same = {base, [&](const YAMLScalar* file_id) { return !differing.contains(file_id); }};
  size_t known_count = 0;
  for (SceneFault& fault : CheckScene(merged, same, settled.touched)) {
    if (settled.known_faults.contains(fault)) {
      if (known_count++ < kMostNamed) {
        settled.notes.push_back({fault.file_id, "Warning: " + fault.file_id->GetText() + ' ' + fault.text +
                                                    ", as before the merge"});
      }
      continue;
    }
    settled.notes.push_back(
        {fault.file_id, fault.file_id->GetText() + ' ' + fault.text + ": please repair this object by hand"});
    resolver.AddRecord(
        {{fault.file_id}, ConflictType::kBothChange, MergeResolve::kConflict, nullptr, nullptr});
  }
  if (known_count > kMostNamed) {
    settled.notes.push_back({nullptr, "Warning: " + std::to_string(known_count - kMostNamed) +
                                          " more faults are as before the merge"});
  }
}

}  // namespace vexel_yaml
