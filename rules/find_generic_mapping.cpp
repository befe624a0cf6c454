#include <algorithm>
#include <stdexcept>
#include <unordered_map>
#include <utility>

#include "rules/yaml_sequence_remapper.h"
#include "yaml/content_digests.h"

namespace vexel_yaml {

namespace {

bool AreEqual(const YAMLNode* a, const YAMLNode* b) {
  // In two long lists that were edited throughout, many pairs are compared: some have equal hashes by chance.
  return a == b || (a != nullptr && a->EqualsByContent(b));
}

// A run of elements of a sequence: those between its common start and its common end.
struct Range {
  const YAMLNode* const* items;
  uint32_t begin;
  uint32_t end;
};

// Takes the first element of a range that equals a given one, and each element only once. A scan of the range
// would do; it would take minutes for a list of 100,000 elements that were all edited. So elements with the
// same content, and only these, share a bucket. (By their hashes they would share it with whatever was made
// to collide with them, and a bucket of all elements is no better than the scan.)
class UnusedElements {
 public:
  explicit UnusedElements(Range range) : range_(range) {
    const uint32_t count = range.end - range.begin;
    next_.resize(count);
    first_.reserve(count);
    for (uint32_t i = range.end; i-- > range.begin;) {
      uint32_t& first = first_.emplace(digests_.Of(range.items[i]), kNone).first->second;
      next_[i - range.begin] = std::exchange(first, i);
    }
  }

  // kDropped where no element is left that equals `wanted`.
  uint32_t Take(const YAMLNode* wanted) {
    const auto bucket = first_.find(digests_.Of(wanted));
    if (bucket == first_.end()) return kNone;
    uint32_t* link = &bucket->second;
    while (*link != kNone && !AreEqual(wanted, range_.items[*link])) link = &next_[*link - range_.begin];
    if (*link == kNone) return kNone;
    const uint32_t taken = *link;
    *link = next_[taken - range_.begin];
    return taken;
  }

 private:
  static constexpr uint32_t kNone = YAMLSequenceRemapper::kDropped;

  const Range range_;
  ContentDigests digests_;
  // The first unused position of each bucket, and behind each position the next one of its bucket.
  std::unordered_map<uint64_t, uint32_t> first_;
  std::vector<uint32_t> next_;
};

std::string DescribeOverlap(const FieldPath& path, size_t base_count, size_t changed_count) {
  return "Cannot match the elements of the list at " + PathToString(path) + ": it has " +
         std::to_string(base_count) + " elements in one version and " + std::to_string(changed_count) +
         " in the other, and the equal ones at its start and at its end overlap, so which of them were added "
         "or "
         "removed can't be told";
}

}  // namespace

YAMLSequenceRemapper* YAMLSequenceRemapper::FindGenericMapping(const FieldPath& path,
                                                               const YAMLSequence& base,
                                                               const YAMLSequence& changed) {
  const YAMLNode* const* from = base.GetItems().data();
  const YAMLNode* const* to = changed.GetItems().data();
  const auto n = static_cast<uint32_t>(base.Size());
  const auto m = static_cast<uint32_t>(changed.Size());
  const uint32_t shorter = std::min(n, m);

  uint32_t prefix = 0;
  while (prefix < shorter && AreEqual(from[prefix], to[prefix])) ++prefix;
  if (n == m && prefix == n) return nullptr;
  // Not bounded by what the prefix left over: [A] against [A, A] is an addition in front.
  uint32_t suffix = 0;
  while (suffix < shorter && AreEqual(from[n - 1 - suffix], to[m - 1 - suffix])) ++suffix;
  if (uint64_t{prefix} + suffix > m) throw std::length_error(DescribeOverlap(path, n, m));

  YAMLSequenceRemapper found(n, m);
  for (uint32_t i = 0; i < prefix; ++i) found.mapping_[i] = i;
  for (uint32_t k = 0; k < suffix; ++k) found.mapping_[n - 1 - k] = m - 1 - k;

  // Where both overlap in `base`, nothing of it is left between them.
  const Range base_middle = {from, prefix, std::max(prefix, n - suffix)};
  const Range changed_middle = {to, prefix, m - suffix};
  if (base_middle.begin == base_middle.end) return IntoPoolUnlessIdentity(std::move(found));
  UnusedElements unused(changed_middle);
  for (uint32_t i = base_middle.begin; i < base_middle.end; ++i) found.mapping_[i] = unused.Take(from[i]);
  return IntoPoolUnlessIdentity(std::move(found));
}

}  // namespace vexel_yaml
