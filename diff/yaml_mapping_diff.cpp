#include "diff/yaml_mapping_diff.h"

#include <unordered_set>

#include "yaml/yaml_error.h"

namespace vexel_yaml {

void YAMLMappingDiff::Add(const YAMLScalar* key, const Operation* operation) {
  const uint32_t index = next_index_++;
  if (!positions_.emplace(key, entries_.size()).second) {
    throw YAMLError("Cannot do a double change on the same key in a mapping");
  }
  entries_.push_back({key, index, operation});
}

const Operation* YAMLMappingDiff::Get(const YAMLScalar* key) const {
  const auto found = positions_.find(key);
  return found == positions_.end() ? nullptr : entries_[found->second].operation;
}

void YAMLMappingDiff::GetKeys(std::vector<Key>& keys) const {
  std::unordered_set<const YAMLScalar*> present;
  for (const Key& key : keys) present.insert(key.key);
  for (const Entry& entry : entries_) {
    if (present.insert(entry.key).second) keys.push_back({static_cast<int>(entry.index), entry.key});
  }
}

void YAMLMappingDiff::ResetForAlloc() {
  next_index_ = 0;
  entries_.clear();
  positions_.clear();
  key_order_ = nullptr;
}

}  // namespace vexel_yaml
