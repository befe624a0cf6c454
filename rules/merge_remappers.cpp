#include "rules/yaml_sequence_remapper.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

constexpr uint32_t kAdded = YAMLSequenceRemapper::kDropped;

// For each element of a side, the base element that it was, or kAdded.
std::vector<uint32_t> Invert(const YAMLSequenceRemapper& side) {
  std::vector<uint32_t> base_of(side.GetDestinationCount(), kAdded);
  const std::vector<uint32_t>& mapping = side.GetMapping();
  for (size_t i = 0; i < mapping.size(); ++i) {
    if (mapping[i] != YAMLSequenceRemapper::kDropped) base_of[mapping[i]] = static_cast<uint32_t>(i);
  }
  return base_of;
}

}  // namespace

YAMLSequenceRemapper* YAMLSequenceRemapper::Merge(const YAMLSequenceRemapper& left,
                                                  const YAMLSequenceRemapper& right,
                                                  YAMLSequenceRemapper*& left_out,
                                                  YAMLSequenceRemapper*& right_out,
                                                  bool drop_if_removed_on_either_side) {
  const auto create_out = [](const YAMLSequenceRemapper& side) {
    auto* out = YAMLAlloc<YAMLSequenceRemapper>::create(side.destination_count_, side.destination_count_);
    out->is_set_ = side.is_set_;
    return out;
  };
  left_out = create_out(left);
  right_out = create_out(right);
  const std::vector<uint32_t> left_base = Invert(left);
  const std::vector<uint32_t> right_base = Invert(right);

  // An added element follows the base element that it was inserted after, left's additions before right's, so
  // that two people who append to one list both keep their order.
  uint32_t next = 0;
  const auto place_additions = [&](YAMLSequenceRemapper& out, const std::vector<uint32_t>& base_of,
                                   size_t first) {
    for (size_t j = first; j < base_of.size() && base_of[j] == kAdded; ++j) out.mapping_[j] = next++;
  };
  place_additions(*left_out, left_base, 0);
  place_additions(*right_out, right_base, 0);

  auto* merged = YAMLAlloc<YAMLSequenceRemapper>::create(static_cast<uint32_t>(left.mapping_.size()), 0U);
  merged->is_set_ = left.is_set_ && right.is_set_;
  for (size_t i = 0; i < left.mapping_.size(); ++i) {
    const uint32_t a = left.mapping_[i];
    const uint32_t b = right.mapping_[i];
    const bool on_both = a != kDropped && b != kDropped;
    const bool on_either = a != kDropped || b != kDropped;
    if (drop_if_removed_on_either_side ? on_both : on_either) {
      if (a != kDropped) left_out->mapping_[a] = next;
      if (b != kDropped) right_out->mapping_[b] = next;
      merged->mapping_[i] = next++;
    }
    if (a != kDropped) place_additions(*left_out, left_base, size_t{a} + 1);
    if (b != kDropped) place_additions(*right_out, right_base, size_t{b} + 1);
  }
  merged->destination_count_ = next;
  return merged;
}

}  // namespace vexel_yaml
