#include "scene/same_fields.h"

#include "rules/path_step.h"
#include "rules/scalar_tolerance.h"
#include "yaml/folded_object.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

bool HaveSameEntries(FieldPath& path, const YAMLMapping& a, const YAMLMapping& b) {
  // Which of several pairs with one key is which can't be told.
  if (a.HasDuplicateKeys() || b.HasDuplicateKeys()) return a.HasSameContent(b);
  if (a.Size() != b.Size()) return false;
  for (const auto& [key, value] : a) {
    const PathStep step(path, key);
    if (!HaveSameFields(path, value, b.Get(key))) return false;
  }
  return true;
}

bool HaveSameElements(FieldPath& path, const YAMLSequence& a, const YAMLSequence& b) {
  if (a.Size() != b.Size()) return false;
  for (size_t i = 0; i < a.Size(); ++i) {
    if (a.GetItems()[i] == b.GetItems()[i]) continue;
    const PathStep step(path, YAMLScalar::Lookup(IntToString(static_cast<int>(i))));
    if (!HaveSameFields(path, a.GetItems()[i], b.GetItems()[i])) return false;
  }
  return true;
}

}  // namespace

bool HaveSameFields(FieldPath& path, const YAMLNode* a, const YAMLNode* b) {
  if (a == b) return true;
  if (a == nullptr || b == nullptr || a->GetKind() != b->GetKind()) return false;
  if (HaveSameText(*a, *b)) return true;
  switch (a->GetKind()) {
    case YAMLNode::Kind::kScalar:
      return AreSameScalars(path, *a->AsScalar(), *b->AsScalar());
    case YAMLNode::Kind::kMapping:
      return HaveSameEntries(path, *a->AsMapping(), *b->AsMapping());
    case YAMLNode::Kind::kSequence:
      return HaveSameElements(path, *a->AsSequence(), *b->AsSequence());
  }
  return false;
}

}  // namespace vexel_yaml
