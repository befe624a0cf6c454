#include "scene/side_match.h"

#include <algorithm>
#include <span>

namespace vexel_yaml {

EditedRange SideMatch::MatchEnds(const IdRange& base, const IdRange& side) {
  const uint32_t n = base.Size(), m = side.Size();
  const uint32_t shorter = std::min(n, m);
  uint32_t prefix = 0;
  while (prefix < shorter && base.ids[base.begin + prefix] == side.ids[side.begin + prefix]) ++prefix;
  uint32_t suffix = 0;
  while (suffix < shorter && base.ids[base.end - 1 - suffix] == side.ids[side.end - 1 - suffix]) ++suffix;
  for (uint32_t i = 0; i < prefix; ++i) Pair(base.begin + i, side.begin + i);
  const uint32_t tail = std::min(suffix, shorter - prefix);
  for (uint32_t i = 1; i <= tail; ++i) Pair(base.end - i, side.end - i);

  EditedRange range;
  range.is_empty = n == m && prefix == n;
  range.is_certain = prefix + tail == prefix + suffix;
  range.begin = base.begin + prefix;
  range.end = base.end - tail;
  if (!range.is_certain) {
    range.begin = base.begin + shorter - suffix;
    range.end = base.begin + prefix + (n - shorter);
  }
  return range;
}

std::vector<Place> SideMatch::Places() const {
  std::vector<Place> places(to_base_.size());
  int64_t nearest = -1;
  for (size_t i = 0; i < places.size(); ++i) {
    places[i].previous = nearest;
    if (to_base_[i] != kNoIndex) nearest = to_base_[i];
  }
  nearest = static_cast<int64_t>(BaseSize());
  for (size_t i = places.size(); i-- > 0;) {
    places[i].next = nearest;
    if (to_base_[i] != kNoIndex) nearest = to_base_[i];
  }
  return places;
}

// Of what both sides inserted into a run, nearer elements of base may be left on one side only.
bool AreSame(const Place& a, const Place& b) {
  return a.previous == b.previous || (a.previous < b.next && b.previous < a.next);
}

namespace {

enum class Fate : uint8_t { kEdited, kRemoved, kUnclear };

}  // namespace

// The runs of elements of base that one side lacks.
class GapMatcher {
 public:
  GapMatcher(SideMatch& match, const std::vector<uint32_t>& ids) : match_(match), ids_(ids) {
    FindGaps();
    for (const Gap& gap : gaps_) {
      if (gap.fate != Fate::kEdited) continue;
      for (uint32_t i = gap.begin; i < gap.end; ++i) match_.Pair(i, gap.first + (i - gap.begin));
    }
    // A side that added nothing only removes.
    if (std::ranges::find(match_.to_base_, kNoIndex) != match_.to_base_.end()) return;
    for (Gap& gap : gaps_) {
      if (gap.fate == Fate::kUnclear) gap.fate = Fate::kRemoved;
    }
  }

  struct Gap {
    // In base.
    uint32_t begin;
    uint32_t end;
    Fate fate = Fate::kUnclear;
    // What the side has instead, where it has the neighbours still side by side.
    uint32_t first = 0;
    uint32_t count = 0;
  };

  // Null where the side has the element.
  const Gap* Find(uint32_t base) const { return gap_of_[base] == kNoIndex ? nullptr : &gaps_[gap_of_[base]]; }

  std::span<const uint32_t> Instead(const Gap& gap) const {
    return std::span(ids_).subspan(gap.first, gap.count);
  }

 private:
  void FindGaps() {
    const auto size = static_cast<uint32_t>(match_.BaseSize());
    gap_of_.assign(size, kNoIndex);
    for (uint32_t begin = 0; begin < size; ++begin) {
      if (match_.ToSide(begin) != kNoIndex) continue;
      Gap gap = {begin, begin};
      while (gap.end < size && match_.ToSide(gap.end) == kNoIndex)
        gap_of_[gap.end++] = static_cast<uint32_t>(gaps_.size());
      Look(gap);
      gaps_.push_back(gap);
      begin = gap.end;
    }
  }

  // What stands between the gap's neighbours.
  void Look(Gap& gap) const {
    const auto& to_base = match_.to_base_;
    const uint32_t first = gap.begin == 0 ? 0 : match_.ToSide(gap.begin - 1) + 1;
    const uint32_t last =
        gap.end == match_.BaseSize() ? static_cast<uint32_t>(to_base.size()) : match_.ToSide(gap.end);
    if (first > last) return;
    if (!std::all_of(to_base.begin() + first, to_base.begin() + last,
                     [](uint32_t base) { return base == kNoIndex; })) {
      return;
    }
    gap.first = first;
    gap.count = last - first;
    if (gap.count == 0) gap.fate = Fate::kRemoved;
    if (gap.count == gap.end - gap.begin) gap.fate = Fate::kEdited;
  }

  SideMatch& match_;
  const std::vector<uint32_t>& ids_;
  std::vector<Gap> gaps_;
  std::vector<uint32_t> gap_of_;
};

namespace {

// Whether it is known what each side did to the elements that both of two gaps hold.
bool AreClear(const GapMatcher& left, const GapMatcher::Gap& a, const GapMatcher& right,
              const GapMatcher::Gap& b) {
  if (a.fate != Fate::kUnclear && b.fate != Fate::kUnclear) return true;
  const bool same_run = a.begin == b.begin && a.end == b.end;
  return same_run && a.count != 0 && std::ranges::equal(left.Instead(a), right.Instead(b));
}

}  // namespace

bool MatchByPlace(SideMatch& left, const std::vector<uint32_t>& left_ids, SideMatch& right,
                  const std::vector<uint32_t>& right_ids) {
  const GapMatcher left_gaps(left, left_ids), right_gaps(right, right_ids);
  for (uint32_t i = 0; i < left.BaseSize(); ++i) {
    const GapMatcher::Gap* a = left_gaps.Find(i);
    const GapMatcher::Gap* b = right_gaps.Find(i);
    if (a == nullptr || b == nullptr) continue;
    if (!AreClear(left_gaps, *a, right_gaps, *b)) return false;
    i = std::min(a->end, b->end) - 1;
  }
  return true;
}

}  // namespace vexel_yaml
