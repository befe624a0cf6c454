#include <typeinfo>
#include <unordered_map>
#include <unordered_set>

#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"

namespace vexel_yaml {

namespace {

YAMLMapping& RequireMapping(YAMLNode* node) {
  YAMLMapping* mapping = node == nullptr ? nullptr : node->AsMapping();
  if (mapping == nullptr) throw std::bad_cast();
  return *mapping;
}

YAMLSequence& RequireSequence(YAMLNode* node) {
  YAMLSequence* sequence = node == nullptr ? nullptr : node->AsSequence();
  if (sequence == nullptr) throw std::bad_cast();
  return *sequence;
}

void FreeOld(YAMLNode* node) {
  if (node != nullptr) node->Free();
}

}  // namespace

void RemoveOperation::Apply(YAMLMapping& mapping, const YAMLScalar* key) const { mapping.Remove(key); }

void RemoveOperation::Apply(YAMLSequence& sequence, int index) const {
  FreeOld(sequence.Set(index, nullptr));
}

void ChangeOperation::Apply(YAMLMapping& mapping, const YAMLScalar* key) const {
  FreeOld(mapping.Change(key, GetValue()->Clone()));
}

void ChangeOperation::Apply(YAMLSequence& sequence, int index) const {
  sequence.Place(index, GetValue()->Clone());
}

void AddOperation::Apply(YAMLMapping& mapping, const YAMLScalar* key) const {
  mapping.Insert(key, GetValue()->Clone());
}

void AddOperation::Apply(YAMLSequence& sequence, int index) const {
  sequence.Place(index, GetValue()->Clone());
}

void ChangeMappingOperation::Apply(YAMLMapping& mapping, const YAMLScalar* key) const {
  diff_->Apply(RequireMapping(&mapping.GetRef(key)));
}

void ChangeMappingOperation::Apply(YAMLSequence& sequence, int index) const {
  diff_->Apply(RequireMapping(sequence.Get(index)));
}

void ChangeSequenceOperation::Apply(YAMLMapping& mapping, const YAMLScalar* key) const {
  ApplyAlways(RequireSequence(&mapping.GetRef(key)));
}

void ChangeSequenceOperation::Apply(YAMLSequence& sequence, int index) const {
  ApplyAlways(RequireSequence(sequence.Get(index)));
}

void ChangeSequenceOperation::ApplyAlways(YAMLSequence& sequence) const {
  if (remapper_ != nullptr) remapper_->Apply(sequence);
  diff_->Apply(sequence);
}

void ChangeSequenceOperation::Apply(YAMLSequence& sequence) const {
  if (remapper_ != nullptr && !remapper_->IsIdentity()) remapper_->Apply(sequence);
  diff_->Apply(sequence);
}

void YAMLSequenceDiff::Apply(YAMLSequence& sequence) const {
  for (const auto& [index, operation] : entries_) operation->Apply(sequence, index);
}

namespace {

// Inserts the keys of `mapping` that `order` lacks: behind the key that precedes them in `base_order`, added
// ones at the end, so that no resolution of the key order can make a merge fail.
std::vector<const YAMLScalar*> CompleteKeyOrder(const std::vector<const YAMLScalar*>& order,
                                                const std::vector<const YAMLScalar*>& base_order,
                                                const YAMLMapping& mapping) {
  std::unordered_set<const YAMLScalar*> placed(order.begin(), order.end());
  std::unordered_map<const YAMLScalar*, std::vector<const YAMLScalar*>> followers;
  std::vector<const YAMLScalar*> completed;
  const YAMLScalar* previous = nullptr;
  for (const YAMLScalar* key : base_order) {
    if (placed.contains(key)) {
      previous = key;
    } else if (mapping.HasKey(key)) {
      (previous == nullptr ? completed : followers[previous]).push_back(key);
      placed.insert(key);
    }
  }
  for (const YAMLScalar* key : order) {
    completed.push_back(key);
    const auto found = followers.find(key);
    if (found != followers.end())
      completed.insert(completed.end(), found->second.begin(), found->second.end());
  }
  for (const auto& [key, value] : mapping) {
    if (!placed.contains(key)) completed.push_back(key);
  }
  return completed;
}

// Whether the keys of `mapping` stand in the order of `order` already: so they do after nearly every edit.
bool IsInOrder(const YAMLSequence& order, const YAMLMapping& mapping) {
  YAMLMapping::Iterator slot = mapping.begin();
  for (const YAMLNode* item : order.GetItems()) {
    if (item == nullptr) continue;
    if (slot == mapping.end() || (*slot).key != item) return false;
    ++slot;
  }
  return slot == mapping.end();
}

// The keys of `order` that `mapping` holds, each at its first place.
std::vector<const YAMLScalar*> PresentKeys(const YAMLSequence& order, const YAMLMapping& mapping) {
  std::vector<const YAMLScalar*> present;
  present.reserve(order.Size());
  std::unordered_set<const YAMLScalar*> seen(order.Size());
  for (const YAMLNode* item : order.GetItems()) {
    const YAMLScalar* key = item == nullptr ? nullptr : item->AsScalar();
    if (key != nullptr && mapping.HasKey(key) && seen.insert(key).second) present.push_back(key);
  }
  return present;
}

}  // namespace

void YAMLMappingDiff::Apply(YAMLMapping& mapping) const {
  std::vector<const YAMLScalar*> base_order;
  base_order.reserve(mapping.Size());
  for (const auto& [key, value] : mapping) base_order.push_back(key);

  for (const Entry& entry : entries_) entry.operation->Apply(mapping, entry.key);
  if (key_order_ == nullptr) return;

  YAMLSequence keys(false);
  keys.Reserve(base_order.size());
  for (const YAMLScalar* key : base_order) keys.Append(key->AsValue());
  key_order_->Apply(keys);
  if (IsInOrder(keys, mapping)) return;
  std::vector<const YAMLScalar*> order = PresentKeys(keys, mapping);
  if (order.size() != mapping.Size()) order = CompleteKeyOrder(order, base_order, mapping);
  mapping.Reorder(order);
}

}  // namespace vexel_yaml
