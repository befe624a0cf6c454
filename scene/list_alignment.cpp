#include "scene/list_alignment.h"

#include <algorithm>

#include "rules/yaml_sequence_remapper.h"
#include "scene/list_numbers.h"
#include "scene/side_match.h"

namespace vexel_yaml {

namespace {

using Ids = std::vector<uint32_t>;

// Where each number occurs in one list, and how often.
struct Occurrences {
  Occurrences(const Ids& ids, size_t id_count) : index(id_count, kNoIndex), count(id_count, 0) {
    for (uint32_t i = 0; i < ids.size(); ++i) {
      index[ids[i]] = i;
      ++count[ids[i]];
    }
  }
  bool AreUnique() const {
    return std::ranges::all_of(count, [](uint32_t times) { return times <= 1; });
  }
  Ids index;
  Ids count;
};

class Aligner {
 public:
  // `has_slots`: whether elements may be known by their place, too.
  Aligner(NumberedLists lists, bool has_keys, bool has_slots)
      : lists_(std::move(lists)),
        has_keys_(has_keys),
        has_slots_(has_slots),
        left_(lists_.base.size(), lists_.left.size()),
        right_(lists_.base.size(), lists_.right.size()) {}

  std::optional<ListAlignment> Align() {
    const Occurrences base(lists_.base, lists_.id_count), left(lists_.left, lists_.id_count);
    const Occurrences right(lists_.right, lists_.id_count);
    const bool are_unique = base.AreUnique() && left.AreUnique() && right.AreUnique();
    if (are_unique) {
      MatchById(left, left_);
      MatchById(right, right_);
      MatchEmpty(lists_.left, left_);
      MatchEmpty(lists_.right, right_);
    } else if (!MatchBetweenAnchors(base, left, right)) {
      return std::nullopt;
    }
    if (has_slots_ && !MatchByPlace(left_, lists_.left, right_, lists_.right)) return std::nullopt;
    if (lists_.are_references && ArePutElsewhere(base, left, right)) return std::nullopt;
    if (has_keys_ && IsEmptyMoved()) return std::nullopt;
    if (!are_unique && (HasMoves(lists_.left, left_) || HasMoves(lists_.right, right_))) return std::nullopt;
    if (!PairAdditions()) return std::nullopt;
    return Result();
  }

 private:
  void MatchById(const Occurrences& side, SideMatch& match) const {
    for (uint32_t i = 0; i < lists_.base.size(); ++i) {
      const uint32_t partner = side.index[lists_.base[i]];
      if (partner != kNoIndex) match.Pair(i, partner);
    }
  }

  // An empty slot among others that came and went is still the same where it kept its place among them, or
  // their number tells no places.
  void MatchEmpty(const Ids& ids, SideMatch& match) const {
    const auto is_empty = [this](uint32_t id) { return lists_.empty.contains(id); };
    const auto in_base = std::ranges::find_if(lists_.base, is_empty),
               in_side = std::ranges::find_if(ids, is_empty);
    if (in_base == lists_.base.end() || in_side == ids.end()) return;
    const auto before = static_cast<uint32_t>(in_base - lists_.base.begin());
    const auto after = static_cast<uint32_t>(in_side - ids.begin());
    const Place place = match.Places()[after];
    if (place.previous >= before || place.next <= before) return;
    uint32_t begin = after, end = after + 1;
    while (begin > 0 && match.ToBase(begin - 1) == kNoIndex) --begin;
    while (end < ids.size() && match.ToBase(end) == kNoIndex) ++end;
    uint32_t first = before, last = before + 1;
    while (first > 0 && match.ToSide(first - 1) == kNoIndex) --first;
    while (last < lists_.base.size() && match.ToSide(last) == kNoIndex) ++last;
    if (end - begin != last - first || after - begin == before - first) match.Pair(before, after);
  }

  // Whether one side moved the empty slot of base, and the other did something else with it.
  bool IsEmptyMoved() const {
    const auto is_moved = [this](uint32_t base, const Ids& ids, const SideMatch& match) {
      if (match.ToSide(base) != kNoIndex) return false;
      for (uint32_t i = 0; i < ids.size(); ++i) {
        if (lists_.empty.contains(ids[i]) && match.ToBase(i) == kNoIndex) return true;
      }
      return false;
    };
    const auto is_kept = [this](uint32_t base, const Ids& ids, const SideMatch& match) {
      return match.ToSide(base) != kNoIndex && lists_.empty.contains(ids[match.ToSide(base)]);
    };
    for (uint32_t i = 0; i < lists_.base.size(); ++i) {
      if (!lists_.empty.contains(lists_.base[i])) continue;
      if (is_moved(i, lists_.left, left_) && !is_kept(i, lists_.right, right_)) return true;
      if (is_moved(i, lists_.right, right_) && !is_kept(i, lists_.left, left_)) return true;
    }
    return false;
  }

  // Whether both sides added one reference, but not in the same place: as slots these are two.
  bool ArePutElsewhere(const Occurrences& base, const Occurrences& left, const Occurrences& right) const {
    const std::vector<Place> left_places = left_.Places(), right_places = right_.Places();
    for (uint32_t i = 0; i < lists_.left.size(); ++i) {
      const uint32_t id = lists_.left[i], partner = right.index[id];
      if (partner == kNoIndex || base.count[id] != 0 || lists_.empty.contains(id)) continue;
      const uint32_t slot = left_.ToBase(i);
      if (left.count[id] > 1 || right.count[id] > 1 || slot != right_.ToBase(partner)) return true;
      if (slot == kNoIndex && !AreSame(left_places[i], right_places[partner])) return true;
    }
    return false;
  }

  // Among equal elements only those are told apart that stand between the same unique ones: on each stretch
  // between two of them, what both versions begin and end with.
  bool MatchBetweenAnchors(const Occurrences& base, const Occurrences& left, const Occurrences& right) {
    Stretch stretch;
    for (const uint32_t id : lists_.base) {
      if (base.count[id] != 1 || left.count[id] != 1 || right.count[id] != 1) continue;
      if (left.index[id] < stretch.left || right.index[id] < stretch.right) return false;
      if (!MatchStretch(stretch, base.index[id], left.index[id], right.index[id])) return false;
      left_.Pair(base.index[id], left.index[id]);
      right_.Pair(base.index[id], right.index[id]);
      stretch = {base.index[id] + 1, left.index[id] + 1, right.index[id] + 1};
    }
    return MatchStretch(stretch, static_cast<uint32_t>(lists_.base.size()),
                        static_cast<uint32_t>(lists_.left.size()),
                        static_cast<uint32_t>(lists_.right.size()));
  }

  // Where a stretch begins in each version.
  struct Stretch {
    uint32_t base = 0;
    uint32_t left = 0;
    uint32_t right = 0;
  };

  bool MatchStretch(const Stretch& begin, uint32_t base_end, uint32_t left_end, uint32_t right_end) {
    const IdRange base = {lists_.base, begin.base, base_end};
    const EditedRange left = left_.MatchEnds(base, {lists_.left, begin.left, left_end});
    const EditedRange right = right_.MatchEnds(base, {lists_.right, begin.right, right_end});
    if (left.is_empty || right.is_empty || (left.is_certain && right.is_certain)) return true;
    return left.end < right.begin || right.end < left.begin;
  }

  // Whether a side has equal elements both among those that went and among those that came: one of them may
  // have been moved.
  bool HasMoves(const Ids& ids, const SideMatch& match) const {
    std::vector<bool> is_removed(lists_.id_count, false);
    for (uint32_t i = 0; i < lists_.base.size(); ++i) {
      const uint32_t partner = match.ToSide(i);
      if (partner == kNoIndex || ids[partner] != lists_.base[i]) is_removed[lists_.base[i]] = true;
    }
    for (uint32_t i = 0; i < ids.size(); ++i) {
      const uint32_t partner = match.ToBase(i);
      const bool is_added = partner == kNoIndex || lists_.base[partner] != ids[i];
      if (is_added && is_removed[ids[i]]) return true;
    }
    return false;
  }

  // What both added is one addition if it has the same key, or equal content and the same place. False where
  // a side added equal elements, so that it can't be told which.
  bool PairAdditions() {
    partners_.assign(lists_.left.size(), kNoIndex);
    const Occurrences left = Additions(lists_.left, left_), right = Additions(lists_.right, right_);
    const std::vector<Place> left_places = left_.Places(), right_places = right_.Places();
    for (uint32_t i = 0; i < lists_.left.size(); ++i) {
      const uint32_t id = lists_.left[i];
      if (left_.ToBase(i) != kNoIndex || right.count[id] == 0) continue;
      if (left.count[id] > 1 || right.count[id] > 1) return false;
      const uint32_t partner = right.index[id];
      if (has_keys_ || AreSame(left_places[i], right_places[partner])) partners_[i] = partner;
    }
    return true;
  }

  Occurrences Additions(const Ids& ids, const SideMatch& match) const {
    Occurrences additions({}, lists_.id_count);
    for (uint32_t i = 0; i < ids.size(); ++i) {
      if (match.ToBase(i) != kNoIndex) continue;
      additions.index[ids[i]] = i;
      ++additions.count[ids[i]];
    }
    return additions;
  }

  ListAlignment Result() const {
    ListAlignment result;
    result.has_keys = has_keys_;
    for (uint32_t i = 0; i < lists_.base.size(); ++i) {
      const uint32_t in_left = left_.ToSide(i), in_right = right_.ToSide(i);
      const auto is_other = [&](const Ids& ids, uint32_t index) {
        if (!has_keys_ || index == kNoIndex || ids[index] == lists_.base[i]) return false;
        return !lists_.empty.contains(ids[index]) || !lists_.empty.contains(lists_.base[i]);
      };
      result.elements.push_back(
          {i, in_left, in_right, is_other(lists_.left, in_left), is_other(lists_.right, in_right)});
    }
    std::vector<bool> is_paired(lists_.right.size(), false);
    for (uint32_t i = 0; i < lists_.left.size(); ++i) {
      if (left_.ToBase(i) != kNoIndex) continue;
      result.elements.push_back({kNoIndex, i, partners_[i]});
      if (partners_[i] != kNoIndex) is_paired[partners_[i]] = true;
    }
    for (uint32_t i = 0; i < lists_.right.size(); ++i) {
      if (right_.ToBase(i) == kNoIndex && !is_paired[i]) result.elements.push_back({kNoIndex, kNoIndex, i});
    }
    return result;
  }

  const NumberedLists lists_;
  const bool has_keys_;
  const bool has_slots_;
  SideMatch left_;
  SideMatch right_;
  // For each element that left added, the one that right added as the same.
  Ids partners_;
};

}  // namespace

std::optional<ListAlignment> AlignLists(const FieldPath& path, const YAMLSequence& base,
                                        const YAMLSequence& left, const YAMLSequence& right) {
  const std::vector<FieldPath>& key_paths = YAMLSequenceRemapper::ChooseKeyPaths(path);
  std::optional<NumberedLists> by_keys = NumberByKeys(key_paths, base, left, right);
  const bool has_keys = by_keys.has_value();
  return Aligner(has_keys ? std::move(*by_keys) : NumberByContent(key_paths, base, left, right), has_keys,
                 !has_keys || HasSlots(key_paths))
      .Align();
}

}  // namespace vexel_yaml
