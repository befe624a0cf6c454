#include "scene/row_of_slots.h"

#include <algorithm>
#include <array>

namespace vexel_yaml {

namespace {

// A scalar, or a reference without any other field.
bool IsPlain(const YAMLNode* element) {
  const YAMLMapping* mapping = element == nullptr ? nullptr : element->AsMapping();
  if (mapping == nullptr) return element == nullptr || element->AsScalar() != nullptr;
  static const YAMLScalar* const type = YAMLScalar::Lookup("type");
  if (mapping->HasDuplicateKeys() || !mapping->HasKey(YAMLScalar::fileID)) return false;
  const size_t known = 1 + (mapping->HasKey(YAMLScalar::guid) ? 1 : 0) + (mapping->HasKey(type) ? 1 : 0);
  return mapping->Size() == known;
}

}  // namespace

bool IsMergeOfSlots(const YAMLSequence& base, const YAMLSequence& left, const YAMLSequence& right,
                    const YAMLSequence& merged, ValueSettler& settler) {
  const size_t size = base.Size();
  if (left.Size() != size || right.Size() != size) return true;
  const auto is_plain = [](const YAMLSequence* list) {
    return std::ranges::all_of(list->GetItems(), IsPlain);
  };
  if (!std::ranges::all_of(std::array{&base, &left, &right}, is_plain)) return true;
  if (merged.Size() != size) return false;
  for (size_t i = 0; i < size; ++i) {
    const YAMLNode *before = base.GetItems()[i], *theirs = left.GetItems()[i], *ours = right.GetItems()[i];
    const bool is_rights = settler.AreSame(before, theirs);
    if (!is_rights && !settler.AreSame(before, ours) && !settler.AreSame(theirs, ours)) return false;
    if (!settler.AreSame(merged.GetItems()[i], is_rights ? ours : theirs)) return false;
  }
  return true;
}

}  // namespace vexel_yaml
