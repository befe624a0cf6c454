#pragma once

#include <cstdint>
#include <vector>

#include "scene/list_alignment.h"

namespace vexel_yaml {

/// A stretch of a list whose elements are given as numbers, equal ones for equal elements.
struct IdRange {
  const std::vector<uint32_t>& ids;
  uint32_t begin;
  uint32_t end;

  uint32_t Size() const { return end - begin; }
};

/// Between which elements of base a side changed something.
struct EditedRange {
  /// Nothing was changed.
  bool is_empty = false;
  /// Whether the range can't be moved: of equal elements side by side, any may be the one that came or went.
  bool is_certain = true;
  uint32_t begin = 0;
  uint32_t end = 0;
};

/// The nearest elements of base in front of an element and behind it. The list's front counts as -1.
struct Place {
  int64_t previous;
  int64_t next;
};

/// Which elements of base one side has, and where.
class SideMatch {
 public:
  SideMatch(size_t base_size, size_t side_size)
      : to_side_(base_size, kNoIndex), to_base_(side_size, kNoIndex) {}

  void Pair(uint32_t base, uint32_t side) {
    to_side_[base] = side;
    to_base_[side] = base;
  }
  /// kNoIndex where it has no partner.
  uint32_t ToSide(uint32_t base) const { return to_side_[base]; }
  uint32_t ToBase(uint32_t side) const { return to_base_[side]; }
  size_t BaseSize() const { return to_side_.size(); }

  /// Pairs what both stretches begin and end with; returns what is between.
  EditedRange MatchEnds(const IdRange& base, const IdRange& side);

  /// The place of each element of the side.
  std::vector<Place> Places() const;

 private:
  friend class GapMatcher;

  std::vector<uint32_t> to_side_;
  std::vector<uint32_t> to_base_;
};

/// Whether two elements, each added by another side, were put between the same elements of base.
bool AreSame(const Place& a, const Place& b);

/// Pairs what each side put in the place of others: a run of elements of base that it lacks, between two that
/// it has, with a run of as many. `left_ids` and `right_ids` number the sides' elements.
/// Returns false where both sides did something to an element of base and it can't be told what: they
/// replaced a run by different numbers of elements.
bool MatchByPlace(SideMatch& left, const std::vector<uint32_t>& left_ids, SideMatch& right,
                  const std::vector<uint32_t>& right_ids);

}  // namespace vexel_yaml
