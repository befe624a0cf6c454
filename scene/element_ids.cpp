#include "scene/element_ids.h"

#include <algorithm>

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

namespace {

// Scalars are interned, so that an address is as good as a text.
void AppendNumber(uint64_t number, std::string& text) {
  text.append(reinterpret_cast<const char*>(&number), sizeof(number));
}

void AppendAddress(const YAMLNode* scalar, std::string& text) {
  AppendNumber(reinterpret_cast<uintptr_t>(scalar), text);
}

std::vector<YAMLMapping::Slot> SortedPairs(const YAMLMapping& mapping) {
  if (mapping.HasDuplicateKeys()) return mapping.GetDuplicatePairs();
  std::vector<YAMLMapping::Slot> pairs;
  pairs.reserve(mapping.Size());
  for (const YAMLMapping::Slot& slot : mapping) pairs.push_back(slot);
  std::ranges::sort(pairs, std::less<>(), &YAMLMapping::Slot::key);
  return pairs;
}

// A text that only a node with the same fields has. Counts keep it from being read in two ways.
void AppendFields(const YAMLNode* node, std::string& text) {
  if (const YAMLSequence* list = node == nullptr ? nullptr : node->AsSequence()) {
    text += '[';
    AppendNumber(list->Size(), text);
    for (const YAMLNode* item : list->GetItems()) AppendFields(item, text);
  } else if (const YAMLMapping* mapping = node == nullptr ? nullptr : node->AsMapping()) {
    const std::vector<YAMLMapping::Slot> pairs = SortedPairs(*mapping);
    text += '{';
    AppendNumber(pairs.size(), text);
    for (const auto& [key, value] : pairs) {
      AppendAddress(key, text);
      AppendFields(value, text);
    }
  } else {
    text += ' ';
    AppendAddress(node, text);
  }
}

}  // namespace

std::vector<uint32_t> ElementIds::Of(const YAMLSequence& list) {
  std::vector<uint32_t> ids;
  ids.reserve(list.Size());
  std::string text;
  for (const YAMLNode* element : list.GetItems()) {
    text.clear();
    AppendFields(element, text);
    ids.push_back(ids_.emplace(text, static_cast<uint32_t>(ids_.size())).first->second);
  }
  return ids;
}

}  // namespace vexel_yaml
