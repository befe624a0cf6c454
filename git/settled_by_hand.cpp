#include "git/settled_by_hand.h"

#include <charconv>
#include <new>
#include <optional>

#include "git/asset_merge.h"
#include "merge/conflict_record_file.h"
#include "report/value_text.h"
#include "rules/path_step.h"
#include "scene/holders.h"
#include "scene/list_alignment.h"
#include "scene/same_fields.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

// What stands at a place in each version; null for nothing.
struct Versions {
  const YAMLNode* merged;
  const YAMLNode* later;
  const YAMLNode* base;
  const YAMLNode* theirs;
};

const YAMLNode* ValueOf(const YAMLNode* node, const YAMLScalar* key) {
  const YAMLMapping* mapping = node == nullptr ? nullptr : node->AsMapping();
  return mapping == nullptr || mapping->HasDuplicateKeys() ? nullptr : mapping->Get(key);
}

const YAMLSequence* ListIn(const YAMLNode* node) { return node == nullptr ? nullptr : node->AsSequence(); }

const YAMLNode* ElementAt(const YAMLSequence* list, uint32_t index) {
  return list == nullptr || index >= list->Size() ? nullptr : list->GetItems()[index];
}

// An element's place in a list: its index in base, or behind a "+" in theirs.
struct ElementName {
  bool is_added = false;
  uint32_t index = 0;
};

std::optional<ElementName> ReadElementName(std::string_view text) {
  ElementName name;
  name.is_added = text.starts_with('+');
  if (name.is_added) text.remove_prefix(1);
  const char* const end = text.data() + text.size();
  const auto [rest, error] = std::from_chars(text.data(), end, name.index);
  return error == std::errc() && rest == end ? std::optional(name) : std::nullopt;
}

class PlaceComparison {
 public:
  PlaceComparison(const std::string& merged, const std::string& later, bool is_safe,
                  const std::function<SideTexts()>& sides)
      : is_safe_(is_safe), sides_(sides) {
    Parse(merged, merged_);
    Parse(later, later_);
  }
  PlaceComparison(const PlaceComparison&) = delete;
  PlaceComparison& operator=(const PlaceComparison&) = delete;

  bool IsSame(const FieldPath& place) {
    found_ = nullptr;
    if (place.size() == 1) return IsSameObject(ResolveEscapes(place.front()));
    for (const YAMLScalar* component : place) {
      if (ReadElementName(component->GetText()) && component != place.front()) ReadSides();
    }
    FieldPath path;
    return IsSameBelow({&merged_, &later_, &base_, &theirs_}, place, path);
  }

  // What was compared last, as it stands in the later version.
  std::string LaterText() const {
    constexpr size_t kMostOfValue = 100;
    if (found_ == nullptr) return {};
    const YAMLScalar* scalar = found_->AsScalar();
    return Shortened(OnOneLine(scalar == nullptr ? found_->GetYAMLString() : scalar->GetText()),
                     kMostOfValue);
  }

 private:
  // Nearly every object is the same in all versions, and is not even looked at.
  void Parse(const std::string& text, VexelObjects& objects) {
    // The parser could not even start.
    if (!ParseYAMLText(FileText(text), objects, cache_)) throw std::bad_alloc();
  }

  // Once, and only for a place that may be in a list.
  void ReadSides() {
    if (are_sides_read_) return;
    are_sides_read_ = true;
    const SideTexts texts = sides_();
    if (!texts.base.empty()) Parse(texts.base, base_);
    if (!texts.theirs.empty()) Parse(texts.theirs, theirs_);
  }

  // What hangs on an object in a version, itself included.
  static std::vector<const YAMLScalar*> PartsOf(const YAMLScalar* object, const VexelObjects& version) {
    std::vector<const YAMLScalar*> all;
    for (const auto& [file_id, value] : version) all.push_back(file_id);
    std::vector<const YAMLScalar*> parts;
    for (const auto& [file_id, top] : FindTops(Holders(version, all), all, {object})) {
      if (top == object) parts.push_back(file_id);
    }
    return parts;
  }

  bool IsSameObject(const YAMLScalar* object) {
    for (const VexelObjects* version : {&merged_, &later_}) {
      for (const YAMLScalar* part : PartsOf(object, *version)) {
        FieldPath path = {part};
        if (!HaveSameFields(path, merged_.Get(part), later_.Get(part))) return false;
      }
    }
    return true;
  }

  // `path` is the part of the place that has been walked.
  bool IsSameBelow(const Versions& at, const FieldPath& place, FieldPath& path) {
    if (path.size() == place.size()) return AreSame(path, at);
    const YAMLScalar* component = place[path.size()];
    if (const YAMLSequence* list = ListIn(at.merged)) return IsSameElement(*list, at, place, path);
    const YAMLMapping* mapping = at.merged == nullptr ? nullptr : at.merged->AsMapping();
    if (mapping == nullptr || mapping->HasDuplicateKeys()) return AreSame(path, at);
    const YAMLScalar* key = mapping->Get(component) != nullptr || ValueOf(at.later, component) != nullptr
                                ? component
                                : ResolveEscapes(component);
    const PathStep step(path, key);
    return IsSameBelow(
        {mapping->Get(key), ValueOf(at.later, key), ValueOf(at.base, key), ValueOf(at.theirs, key)}, place,
        path);
  }

  bool IsSameElement(const YAMLSequence& list, const Versions& at, const FieldPath& place, FieldPath& path) {
    const auto name = ReadElementName(place[path.size()]->GetText());
    const YAMLSequence* later = ListIn(at.later);
    // Without safe merges, indices are those of the merged list.
    const YAMLSequence* named = !is_safe_ ? &list : ListIn(name && name->is_added ? at.theirs : at.base);
    const auto alignment =
        name && later != nullptr && named != nullptr ? AlignLists(path, list, *named, *later) : std::nullopt;
    if (alignment) {
      for (const AlignedElement& element : alignment->elements) {
        if (element.left != name->index || element.base == kNoIndex) continue;
        const YAMLNode* reference = ElementAt(named, name->index);
        const PathStep step(path, place[path.size()]);
        return IsSameBelow({ElementAt(&list, element.base), ElementAt(later, element.right),
                            name->is_added ? nullptr : reference, name->is_added ? reference : nullptr},
                           place, path);
      }
    }
    return AreSame(path, at);
  }

  bool AreSame(FieldPath& path, const Versions& at) {
    found_ = at.later;
    return HaveSameFields(path, at.merged, at.later);
  }

  const bool is_safe_;
  const std::function<SideTexts()>& sides_;
  bool are_sides_read_ = false;
  const YAMLNode* found_ = nullptr;
  DocumentCache cache_;
  VexelObjects merged_;
  VexelObjects later_;
  VexelObjects base_;
  VexelObjects theirs_;
};

}  // namespace

std::map<std::string, std::string> FindSettledByHand(const std::string& merged, const std::string& later,
                                                     const MergeSettings& settings,
                                                     const std::function<SideTexts()>& sides,
                                                     const std::vector<RecordedConflict>& conflicts) {
  std::map<std::string, std::string> settled;
  if (merged == later) return settled;
  try {
    LoadRulesAndTypes(settings);
    PlaceComparison comparison(merged, later, settings.is_safe, sides);
    for (const RecordedConflict& conflict : conflicts) {
      if (conflict.is_settled || comparison.IsSame(StringToPath(conflict.place))) continue;
      settled.emplace(conflict.place, comparison.LaterText());
    }
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const YAMLError&) {
    // Whoever commits such a file is asked.
  } catch (const std::exception&) {
    // The same for rules that can't be read.
  }
  return settled;
}

void MarkSettledByHand(const std::string& merged, const std::string& later, const MergeSettings& settings,
                       const std::function<SideTexts()>& sides, std::vector<RecordedConflict>& conflicts) {
  const auto settled = FindSettledByHand(merged, later, settings, sides, conflicts);
  for (RecordedConflict& conflict : conflicts) conflict.is_settled |= settled.contains(conflict.place);
}

}  // namespace vexel_yaml
