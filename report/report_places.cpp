#include "report/report_places.h"

#include <algorithm>

#include "diff/yaml_mapping_diff.h"
#include "report/object_names.h"
#include "scene/list_alignment.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

bool IsNewElement(const YAMLScalar* step) {
  const std::string& text = step->GetText();
  return text.size() > 1 && text[0] == kNewElement && text[1] >= '0' && text[1] <= '9';
}

const YAMLNode* NodeAt(const YAMLNode* node, const FieldPath& path) {
  for (const YAMLScalar* step : path) {
    if (node == nullptr) return nullptr;
    if (const YAMLMapping* mapping = node->AsMapping()) {
      node = mapping->HasDuplicateKeys() ? nullptr : mapping->Get(step);
    } else if (const YAMLSequence* sequence = node->AsSequence()) {
      const auto index = static_cast<size_t>(step->GetIntValue());
      node = !IsNewElement(step) && index < sequence->Size() ? sequence->GetItems()[index] : nullptr;
    } else {
      return nullptr;
    }
  }
  return node;
}

std::string PropertyOf(const YAMLNode* element) {
  const YAMLNode* property = NodeAt(element, {YAMLScalar::Lookup("propertyPath")});
  return property == nullptr || property->AsScalar() == nullptr ? std::string()
                                                                : property->AsScalar()->GetText();
}

bool IsPartOfReference(const FieldPath& path) {
  return path.size() > 2 && (path.back() == YAMLScalar::fileID || path.back() == YAMLScalar::guid);
}

FieldPath Above(FieldPath path) {
  path.pop_back();
  return path;
}

const YAMLNode* After(const YAMLNode* value, const Operation* edit) {
  if (edit == nullptr || value == nullptr) return value;
  auto* holder = YAMLAlloc<YAMLMapping>::create(false);
  holder->Insert(YAMLScalar::underscore, value->Clone());
  edit->Apply(*holder, YAMLScalar::underscore);
  return holder->Get(YAMLScalar::underscore);
}

namespace {

// An edit of something around the reference, such as the moves that make a circle, can't be made in it.
bool IsReferenceEdit(const Operation& edit) {
  if (edit.GetKind() != Operation::Kind::kChangeMapping) return false;
  const auto& entries = static_cast<const ChangeMappingOperation&>(edit).GetDiff()->GetEntries();
  return std::ranges::all_of(entries, [](const YAMLMappingDiff::Entry& entry) {
    return entry.key == YAMLScalar::fileID || entry.key == YAMLScalar::guid || entry.key->GetText() == "type";
  });
}

}  // namespace

std::optional<const YAMLNode*> FindElement(const FieldPath& path, const VexelObjects& base,
                                           const VexelObjects& later) {
  const FieldPath place = Above(path);
  const auto list_in = [&](const VexelObjects& version) {
    const YAMLNode* list = NodeAt(&version, place);
    return list == nullptr ? nullptr : list->AsSequence();
  };
  const YAMLSequence *before = list_in(base), *after = list_in(later);
  const YAMLNode* element = NodeAt(&base, path);
  if (before == nullptr || after == nullptr || element == nullptr) return std::nullopt;
  const auto alignment = AlignLists(place, *before, *after, *after);
  if (!alignment) return std::nullopt;
  for (const AlignedElement& aligned : alignment->elements) {
    if (aligned.base == kNoIndex || before->GetItems()[aligned.base] != element) continue;
    return aligned.left == kNoIndex ? nullptr : after->GetItems()[aligned.left];
  }
  return std::nullopt;
}

const YAMLNode* ValueAfter(const YAMLNode* base, const Operation* edit) {
  if (edit == nullptr || edit->GetKind() == Operation::Kind::kRemove) return nullptr;
  const auto kind = edit->GetKind();
  if (kind == Operation::Kind::kAdd || kind == Operation::Kind::kChange)
    return static_cast<const ValuedOperation*>(edit)->GetValue();
  if (base == nullptr) return nullptr;
  const bool is_list = kind == Operation::Kind::kChangeSequence && base->AsSequence() != nullptr;
  return is_list || (IsReference(base) && IsReferenceEdit(*edit)) ? After(base, edit) : nullptr;
}

}  // namespace vexel_yaml
