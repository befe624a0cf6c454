#include "diff/strip_unchanged.h"

#include <vector>

namespace vexel_yaml {

namespace {

// Whether an entry stays that the other file has, too; strips a mapping that changed only inside.
bool KeepEntry(YAMLNode& value, const Operation* operation) {
  if (operation == nullptr) return false;
  switch (operation->GetKind()) {
    case Operation::Kind::kRemove:
      return false;
    case Operation::Kind::kChange:
    case Operation::Kind::kAdd:
    case Operation::Kind::kChangeSequence:
      return true;
    case Operation::Kind::kChangeMapping:
      if (YAMLMapping* mapping = value.AsMapping()) {
        StripUnchangedMapping(*mapping, *static_cast<const ChangeMappingOperation*>(operation)->GetDiff());
      }
      return true;
  }
  return true;
}

}  // namespace

void StripUnchangedMapping(YAMLMapping& mapping, const YAMLMappingDiff& diff) {
  std::vector<const YAMLScalar*> dropped;
  for (const auto& [key, value] : mapping) {
    const bool keep = KeepEntry(*value, diff.Get(key)) || key == YAMLScalar::fileIDPlaceHolderName ||
                      key == YAMLScalar::classIDPlaceHolderName;
    if (!keep) dropped.push_back(key);
  }
  for (const YAMLScalar* key : dropped) mapping.Remove(key);
}

void StripUnchanged(VexelObjects& objects, const YAMLMappingDiff& diff) {
  StripUnchangedMapping(objects.GetMapping(), diff);
}

}  // namespace vexel_yaml
