#include "rules/yaml_sequence_remapper.h"

#include <algorithm>
#include <numeric>
#include <utility>

#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

YAMLSequenceRemapper::YAMLSequenceRemapper(uint32_t source_count, uint32_t destination_count)
    : mapping_(source_count, kDropped), destination_count_(destination_count) {}

YAMLSequenceRemapper* YAMLSequenceRemapper::CreateIdentity(uint32_t count) {
  auto* identity = YAMLAlloc<YAMLSequenceRemapper>::create(count, count);
  std::iota(identity->mapping_.begin(), identity->mapping_.end(), 0U);
  identity->is_set_ = true;
  return identity;
}

bool YAMLSequenceRemapper::IsIdentity() const {
  if (destination_count_ != mapping_.size()) return false;
  for (size_t i = 0; i < mapping_.size(); ++i) {
    if (mapping_[i] != i) return false;
  }
  return true;
}

void YAMLSequenceRemapper::RemoveDestinations(const std::vector<uint32_t>& ascending) {
  for (uint32_t& destination : mapping_) {
    if (destination == kDropped) continue;
    const auto before = std::lower_bound(ascending.begin(), ascending.end(), destination);
    destination -= static_cast<uint32_t>(before - ascending.begin());
  }
  destination_count_ -= static_cast<uint32_t>(ascending.size());
}

void YAMLSequenceRemapper::Apply(YAMLSequence& sequence) const {
  std::vector<YAMLNode*> rearranged(destination_count_, nullptr);
  std::vector<YAMLNode*> items = sequence.SwapItems({});
  const size_t count = std::min(items.size(), mapping_.size());
  for (size_t i = 0; i < count; ++i) {
    if (mapping_[i] != kDropped) rearranged[mapping_[i]] = std::exchange(items[i], nullptr);
  }
  for (YAMLNode* dropped : items) {
    if (dropped != nullptr) dropped->Free();
  }
  sequence.SwapItems(std::move(rearranged));
}

void YAMLSequenceRemapper::ResetForAlloc() {
  // Gives the memory back as well: a spare must not hold on to the mapping of the largest list ever seen.
  *this = YAMLSequenceRemapper();
}

YAMLSequenceRemapper* YAMLSequenceRemapper::IntoPoolUnlessIdentity(YAMLSequenceRemapper found) {
  if (found.IsIdentity()) return nullptr;
  return YAMLAlloc<YAMLSequenceRemapper>::create(std::move(found));
}

}  // namespace vexel_yaml
