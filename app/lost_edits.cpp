#include "app/lost_edits.h"

#include <algorithm>
#include <map>
#include <vector>

#include "diff/yaml_sequence_diff.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

namespace {

using KeyPaths = std::vector<FieldPath>;

const YAMLNode* Child(const YAMLNode* node, const YAMLScalar* key) {
  return node == nullptr || node->AsMapping() == nullptr ? nullptr : node->AsMapping()->Get(key);
}

const std::vector<YAMLNode*>& ElementsOf(const YAMLNode* list) {
  static const std::vector<YAMLNode*> none;
  return list == nullptr || list->AsSequence() == nullptr ? none : list->AsSequence()->GetItems();
}

// Null for an element without a key.
const YAMLScalar* KeyOf(const KeyPaths& paths, const YAMLNode* element) {
  const auto values = YAMLSequenceRemapper::GetUniqueMappingValues(paths, element);
  return values.empty() ? nullptr : YAMLSequenceRemapper::CollapseKeyElementValues(values);
}

// The elements of a list by their keys, and how many there are of each.
class KeyedElements {
 public:
  KeyedElements(const KeyPaths& paths, const YAMLNode* list) {
    for (const YAMLNode* element : ElementsOf(list)) {
      const YAMLScalar* key = KeyOf(paths, element);
      is_unique_ = is_unique_ && key != nullptr && !by_key_.contains(key);
      by_key_.emplace(key, element);
      ++counts_[key];
    }
  }

  bool IsUnique() const { return is_unique_; }
  const std::map<const YAMLScalar*, const YAMLNode*>& Get() const { return by_key_; }
  const YAMLNode* Find(const YAMLScalar* key) const {
    const auto found = by_key_.find(key);
    return found == by_key_.end() ? nullptr : found->second;
  }
  size_t Count(const YAMLScalar* key) const {
    const auto found = counts_.find(key);
    return found == counts_.end() ? 0 : found->second;
  }

 private:
  bool is_unique_ = true;
  std::map<const YAMLScalar*, const YAMLNode*> by_key_;
  std::map<const YAMLScalar*, size_t> counts_;
};

std::map<std::string, size_t> CountContents(const YAMLNode* list) {
  std::map<std::string, size_t> counts;
  for (const YAMLNode* element : ElementsOf(list)) ++counts[Content(element)];
  return counts;
}

// One node in the versions that are compared.
struct Place {
  const YAMLNode* base;
  const YAMLNode* side;
  const YAMLNode* other;
  const YAMLNode* merged;
};

class LostEditSearch {
 public:
  LostEditSearch(const RecordingConflictResolver& resolver, size_t& excused)
      : resolver_(resolver), excused_(excused) {}

  bool IsLost(const Place& place) {
    const auto& [base, side, other, merged] = place;
    if (base == other || (base != nullptr && other != nullptr && base->HasSameContent(*other))) {
      return Content(side) != Content(merged) && !IsPending(false);
    }
    if (side == nullptr || other == nullptr || side->GetKind() != other->GetKind()) return false;
    if (side->AsMapping() != nullptr) return IsLostInMapping(place);
    if (side->AsSequence() == nullptr || !IsLostInList(place)) return false;
    if (!CountAsEqual(place)) return true;
    ++excused_;
    return false;
  }

 private:
  // Whether a conflict is recorded at the path or above it, or anywhere below it too.
  bool IsPending(bool below) const {
    return std::ranges::any_of(resolver_.GetRecords(), [&](const auto& record) {
      const size_t common = std::min(record.path.size(), path_.size());
      return record.resolution == MergeResolve::kConflict && (below || record.path.size() == common) &&
             std::equal(path_.begin(), path_.begin() + static_cast<ptrdiff_t>(common), record.path.begin());
    });
  }

  bool IsLostAt(const YAMLScalar* key, const Place& place) {
    path_.push_back(key);
    const bool lost = IsLost(place);
    path_.pop_back();
    return lost;
  }

  bool IsLostInMapping(const Place& place) {
    for (const YAMLNode* holder : {place.side, place.base}) {
      if (holder == nullptr || holder->AsMapping() == nullptr) continue;
      for (const auto& [key, value] : *holder->AsMapping()) {
        if (holder == place.base && Child(place.side, key) != nullptr) continue;
        if (IsLostAt(key, {Child(place.base, key), Child(place.side, key), Child(place.other, key),
                           Child(place.merged, key)})) {
          return true;
        }
      }
    }
    return false;
  }

  bool IsLostInList(const Place& place) {
    // Records name the places of the merged list, which can't be told from those of the versions.
    if (IsPending(true)) return false;
    if (place.base == nullptr || place.base->AsSequence() == nullptr) return IsLostByPlace(place);
    const KeyPaths& paths = YAMLSequenceRemapper::ChooseKeyPaths(path_);
    const KeyedElements base(paths, place.base), side(paths, place.side), other(paths, place.other);
    const KeyedElements merged(paths, place.merged);
    if (paths.empty() || !base.IsUnique() || !side.IsUnique() || !other.IsUnique()) {
      return IsLostByContent(place, paths, base, other);
    }
    for (const KeyedElements* holder : {&side, &base}) {
      for (const auto& [key, element] : holder->Get()) {
        if (holder == &base && side.Find(key) != nullptr) continue;
        if (IsLostAt(YAMLScalar::star, {base.Find(key), side.Find(key), other.Find(key), merged.Find(key)})) {
          return true;
        }
      }
    }
    return false;
  }

  // A list that both sides added is put together place by place.
  bool IsLostByPlace(const Place& place) {
    const auto at = [](const YAMLNode* list, size_t index) {
      return index < ElementsOf(list).size() ? ElementsOf(list)[index] : nullptr;
    };
    for (size_t i = 0; i < ElementsOf(place.side).size(); ++i) {
      if (IsLostAt(YAMLScalar::star, {nullptr, at(place.side, i), at(place.other, i), at(place.merged, i)})) {
        return true;
      }
    }
    return false;
  }

  // Each element that only `side` added or removed must be there as often as in `side`. One whose key the
  // other side added or removed as well may have become one with that side's.
  static bool IsLostByContent(const Place& place, const KeyPaths& paths, const KeyedElements& base_keys,
                              const KeyedElements& other_keys) {
    auto base = CountContents(place.base), other = CountContents(place.other);
    auto side = CountContents(place.side), merged = CountContents(place.merged);
    for (const YAMLNode* list : {place.side, place.base}) {
      for (const YAMLNode* element : ElementsOf(list)) {
        const YAMLScalar* key = paths.empty() ? nullptr : KeyOf(paths, element);
        if (key != nullptr && base_keys.Count(key) != other_keys.Count(key)) continue;
        const std::string content = Content(element);
        if (base[content] == other[content] && side[content] != merged[content]) return true;
      }
    }
    return false;
  }

  // Two edits that put the same at the same places count as equal, and left's is taken, though they may have
  // removed or moved different elements. Here the merge is asked itself, so that what it loses by this can't
  // be found: whoever reads the result must be told how often.
  bool CountAsEqual(const Place& place) {
    if (place.base == nullptr || place.base->AsSequence() == nullptr) return false;
    const Operation* side = CreateDiffOperation(path_, place.base, place.side);
    const Operation* other = CreateDiffOperation(path_, place.base, place.other);
    return side != nullptr && other != nullptr && OperationEquals(*side, *other);
  }

  const RecordingConflictResolver& resolver_;
  size_t& excused_;
  FieldPath path_;
};

}  // namespace

std::string Content(const YAMLNode* node) {
  if (node == nullptr) return "";
  if (const YAMLScalar* scalar = node->AsScalar()) return "'" + scalar->GetText() + "'";
  std::vector<std::string> parts;
  if (const YAMLMapping* mapping = node->AsMapping()) {
    for (const auto& [key, value] : *mapping) parts.push_back(key->GetText() + ": " + Content(value));
  } else {
    for (const YAMLNode* item : node->AsSequence()->GetItems()) parts.push_back(Content(item));
  }
  std::ranges::sort(parts);
  std::string text = node->AsMapping() != nullptr ? "{" : "[";
  for (const std::string& part : parts) text += part + ",\n";
  return text;
}

bool IsAnythingLost(const YAMLNode& base, const YAMLNode& side, const YAMLNode& other, const YAMLNode& merged,
                    const RecordingConflictResolver& resolver, size_t* excused) {
  size_t uncounted = 0;
  return LostEditSearch(resolver, excused == nullptr ? uncounted : *excused)
      .IsLost({&base, &side, &other, &merged});
}

}  // namespace vexel_yaml
