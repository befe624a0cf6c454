#include <algorithm>
#include <stdexcept>
#include <unordered_map>
#include <utility>

#include "rules/yaml_sequence_remapper.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

namespace {

bool AreEqual(const YAMLNode* a, const YAMLNode* b) {
  // In two long lists that were edited throughout, many pairs are compared: some have equal hashes by chance.
  return a == b || (a != nullptr && b != nullptr && a->Equals(b) && a->HasSameContent(*b));
}

// Whether `node` has content but no hash, so that only a comparison can tell what it equals.
bool LacksHash(const YAMLNode* node) {
  if (node == nullptr || node->GetHash() != 0) return false;
  if (const YAMLSequence* sequence = node->AsSequence()) return sequence->Size() != 0;
  const YAMLMapping* mapping = node->AsMapping();
  return mapping != nullptr && (mapping->HasDuplicateKeys() || mapping->Size() != 0);
}

// A run of elements of a sequence: those between its common start and its common end.
struct Range {
  const YAMLNode* const* items;
  uint32_t begin;
  uint32_t end;

  bool HasElementWithoutHash() const { return std::any_of(items + begin, items + end, LacksHash); }
};

// Takes the first element of a range that equals a given one, and each element only once. A scan of the range
// would do; it would take minutes for a list of 100,000 elements that were all edited.
class UnusedElements {
 public:
  UnusedElements(Range range, bool by_hash) : range_(range), by_hash_(by_hash) {
    const uint32_t count = range.end - range.begin;
    next_.resize(count);
    first_.reserve(by_hash ? count : 1);
    for (uint32_t i = range.end; i-- > range.begin;) {
      uint32_t& first = first_.emplace(BucketOf(range.items[i]), kNone).first->second;
      next_[i - range.begin] = std::exchange(first, i);
    }
  }

  // kDropped where no element is left that equals `wanted`.
  uint32_t Take(const YAMLNode* wanted) {
    const auto bucket = first_.find(BucketOf(wanted));
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

  // Equal elements are in one bucket: a scalar's is its own, since texts with one hash are easily made.
  // Without a hash are empty slots, empty mappings and empty sequences: each kind has a bucket, beyond all
  // hashes.
  uint64_t BucketOf(const YAMLNode* node) const {
    if (!by_hash_) return 0;
    if (node != nullptr && node->AsScalar() != nullptr)
      return (uint64_t{1} << 63) | reinterpret_cast<uintptr_t>(node);
    if (node == nullptr) return uint64_t{1} << 32;
    if (node->GetHash() != 0) return node->GetHash();
    return (uint64_t{2} << 32) + static_cast<uint64_t>(node->GetKind());
  }

  const Range range_;
  const bool by_hash_;
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
  const bool by_hash = !base_middle.HasElementWithoutHash() && !changed_middle.HasElementWithoutHash();
  UnusedElements unused(changed_middle, by_hash);
  for (uint32_t i = base_middle.begin; i < base_middle.end; ++i) found.mapping_[i] = unused.Take(from[i]);
  return IntoPoolUnlessIdentity(std::move(found));
}

}  // namespace vexel_yaml
