#include "diff/yaml_sequence_diff.h"

#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

void YAMLSequenceDiff::Add(int index, const Operation* operation) {
  if (!entries_.emplace(index, operation).second) {
    throw YAMLError("Cannot do a double change on the same key in a sequence");
  }
}

void YAMLSequenceDiff::Replace(int index, const Operation* operation) {
  const auto found = entries_.find(index);
  if (found == entries_.end()) throw YAMLError("Cannot replace non-existing key in a sequence");
  found->second = operation;
}

void YAMLSequenceDiff::RemoveAndShiftMany(const std::set<int>& removed) {
  std::map<int, const Operation*> shifted;
  int shift = 0;
  auto next_removed = removed.begin();
  for (const auto& [index, operation] : entries_) {
    for (; next_removed != removed.end() && *next_removed < index; ++next_removed) ++shift;
    if (next_removed != removed.end() && *next_removed == index) continue;
    shifted.emplace(index - shift, operation);
  }
  entries_ = std::move(shifted);
}

const Operation* YAMLSequenceDiff::Get(int index) const {
  const auto found = entries_.find(index);
  return found == entries_.end() ? nullptr : found->second;
}

void YAMLSequenceDiff::GetKeys(std::set<int>& keys) const {
  for (const auto& [index, operation] : entries_) keys.insert(index);
}

YAMLSequenceDiff* YAMLSequenceDiff::Remap(const YAMLSequenceRemapper& remapper) const {
  auto* remapped = YAMLAlloc<YAMLSequenceDiff>::create();
  const std::vector<uint32_t>& mapping = remapper.GetMapping();
  for (const auto& [index, operation] : entries_) {
    const uint32_t target = mapping.at(static_cast<size_t>(index));
    if (target != YAMLSequenceRemapper::kDropped) remapped->entries_[static_cast<int>(target)] = operation;
  }
  return remapped;
}

}  // namespace vexel_yaml
