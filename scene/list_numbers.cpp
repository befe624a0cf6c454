#include "scene/list_numbers.h"

#include <unordered_map>

#include "rules/element_keys.h"
#include "rules/yaml_sequence_remapper.h"
#include "scene/element_ids.h"

namespace vexel_yaml {

namespace {

using Ids = std::vector<uint32_t>;

class KeyNumbers {
 public:
  KeyNumbers(const std::vector<FieldPath>& key_paths, bool has_slots, NumberedLists& lists)
      : reader_(key_paths), has_slots_(has_slots), lists_(lists) {}

  // False where an element has no key, or shares it.
  bool Number(const YAMLSequence& list, Ids& ids) {
    std::unordered_set<const YAMLScalar*> seen;
    for (const YAMLNode* element : list.GetItems()) {
      const YAMLScalar* key = reader_.Read(element);
      if (key == nullptr || !seen.insert(key).second) return false;
      if (has_slots_ && key == YAMLScalar::zero) {
        ids.push_back(static_cast<uint32_t>(lists_.id_count++));
        lists_.empty.insert(ids.back());
        continue;
      }
      const auto [known, is_new] = known_.emplace(key, static_cast<uint32_t>(lists_.id_count));
      if (is_new) ++lists_.id_count;
      ids.push_back(known->second);
    }
    return true;
  }

 private:
  const ElementKeyReader reader_;
  const bool has_slots_;
  NumberedLists& lists_;
  std::unordered_map<const YAMLScalar*, uint32_t> known_;
};

}  // namespace

bool HasSlots(const std::vector<FieldPath>& key_paths) {
  return key_paths.empty() || &key_paths == &YAMLSequenceRemapper::defaultPath;
}

std::optional<NumberedLists> NumberByKeys(const std::vector<FieldPath>& key_paths, const YAMLSequence& base,
                                          const YAMLSequence& left, const YAMLSequence& right) {
  if (key_paths.empty()) return std::nullopt;
  NumberedLists lists;
  KeyNumbers numbers(key_paths, HasSlots(key_paths), lists);
  if (!numbers.Number(base, lists.base) || !numbers.Number(left, lists.left) ||
      !numbers.Number(right, lists.right)) {
    return std::nullopt;
  }
  lists.are_references = HasSlots(key_paths);
  return lists;
}

NumberedLists NumberByContent(const std::vector<FieldPath>& key_paths, const YAMLSequence& base,
                              const YAMLSequence& left, const YAMLSequence& right) {
  ElementIds ids;
  NumberedLists lists = {ids.Of(base), ids.Of(left), ids.Of(right)};
  lists.id_count = ids.Count();
  lists.are_references = !key_paths.empty() && HasSlots(key_paths);
  const ElementKeyReader reader(key_paths);
  const auto look_at = [&](const YAMLSequence& list, const Ids& numbers) {
    for (size_t i = 0; lists.are_references && i < numbers.size(); ++i) {
      const YAMLScalar* key = reader.Read(list.GetItems()[i]);
      if (key == nullptr) lists.are_references = false;
      if (key == YAMLScalar::zero) lists.empty.insert(numbers[i]);
    }
  };
  look_at(base, lists.base);
  look_at(left, lists.left);
  look_at(right, lists.right);
  return lists;
}

}  // namespace vexel_yaml
