#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace vexel_yaml {

/// A hash table of positions in a list that its owner keeps: open addressing, linear probing, four bytes an
/// entry. A table of nodes took a fifth of the memory of a merge in which nearly nothing was edited.
///
/// It holds no keys. Whoever looks something up says whether a position is the one, so a position whose
/// element has gone or is another one now does no harm.
class PositionIndex {
 public:
  static constexpr uint32_t kNone = UINT32_MAX;

  /// With room for `count` insertions.
  explicit PositionIndex(size_t count)
      : room_(count),
        entries_(std::bit_ceil(count * 2 + 2), kNone),
        shift_(64 - std::countr_zero(entries_.size())) {}

  bool IsFull() const { return count_ == room_; }

  /// Only while it is not full.
  void Insert(uint64_t hash, uint32_t position) {
    size_t at = First(hash);
    while (entries_[at] != kNone) at = Next(at);
    entries_[at] = position;
    ++count_;
  }

  /// The first position inserted with an equal hash, or one near it, for which `matches(position)` holds.
  template <typename Matches>
  uint32_t Find(uint64_t hash, Matches matches) const {
    for (size_t at = First(hash); entries_[at] != kNone; at = Next(at)) {
      if (matches(entries_[at])) return entries_[at];
    }
    return kNone;
  }

 private:
  // Multiplied by the golden ratio's fraction, the upper bits depend on all of the hash's.
  size_t First(uint64_t hash) const { return (hash * 0x9E3779B97F4A7C15U) >> shift_; }
  size_t Next(size_t at) const { return (at + 1) & (entries_.size() - 1); }

  size_t count_ = 0;
  size_t room_;
  std::vector<uint32_t> entries_;
  int shift_;
};

}  // namespace vexel_yaml
