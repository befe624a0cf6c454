#include "yaml/content_digests.h"

#include <string_view>

#include "platform/text_hash.h"
#include "yaml/yaml_mapping.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

uint64_t ContentDigests::Of(const YAMLNode* node) {
  // A scalar is interned: its place in memory is its text's.
  if (node == nullptr || node->AsScalar() != nullptr) return reinterpret_cast<uintptr_t>(node);
  if (const auto found = known_.find(node); found != known_.end()) return found->second;

  const size_t first = parts_.size();
  const auto add_pair = [&](const YAMLMapping::Slot& slot) {
    parts_.push_back(reinterpret_cast<uintptr_t>(slot.key));
    const uint64_t value = Of(slot.value);
    parts_.push_back(value);
  };
  if (const YAMLSequence* sequence = node->AsSequence()) {
    parts_.push_back(0);
    for (const YAMLNode* item : sequence->GetItems()) {
      const uint64_t digest = Of(item);
      parts_.push_back(digest);
    }
  } else if (const YAMLMapping* mapping = node->AsMapping(); mapping->HasDuplicateKeys()) {
    parts_.push_back(1);
    for (const YAMLMapping::Slot& slot : mapping->GetDuplicatePairs()) add_pair(slot);
  } else {
    parts_.push_back(2);
    for (const YAMLMapping::Slot& slot : *mapping) add_pair(slot);
  }
  const uint64_t digest = HashText(
      {reinterpret_cast<const char*>(parts_.data() + first), (parts_.size() - first) * sizeof(uint64_t)});
  parts_.resize(first);
  known_.emplace(node, digest);
  return digest;
}

}  // namespace vexel_yaml
