#include "report/shown_diff.h"

#include <stdexcept>

#include "rules/path_step.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

YAMLMappingDiff* DiffMappings(FieldPath& path, const YAMLMapping& from, const YAMLMapping& to);

const Operation* DiffAt(FieldPath& path, const YAMLNode* from, const YAMLNode* to) {
  try {
    FieldPath walked = path;
    return CreateDiffOperation(walked, from, to);
  } catch (const std::length_error&) {
    const YAMLMapping* mapping = from->AsMapping();
    const YAMLMapping* changed = to->AsMapping();
    if (mapping == nullptr || changed == nullptr) return YAMLAlloc<ChangeOperation>::create(to);
    return YAMLAlloc<ChangeMappingOperation>::create(DiffMappings(path, *mapping, *changed), false);
  }
}

YAMLMappingDiff* DiffMappings(FieldPath& path, const YAMLMapping& from, const YAMLMapping& to) {
  auto* diff = YAMLAlloc<YAMLMappingDiff>::create();
  const auto add = [&](const YAMLScalar* key, const YAMLNode* value, const YAMLNode* changed) {
    const PathStep step(path, key);
    if (const Operation* operation = DiffAt(path, value, changed)) diff->Add(key, operation);
  };
  for (const auto& [key, value] : from) add(key, value, to.Get(key));
  for (const auto& [key, value] : to) {
    if (!from.HasKey(key)) add(key, nullptr, value);
  }
  return diff;
}

}  // namespace

const YAMLMappingDiff* DiffToShow(const YAMLMapping& from, const YAMLMapping& to) {
  try {
    return YAMLMappingDiff::Diff(from, to);
  } catch (const std::length_error&) {
    FieldPath path;
    return DiffMappings(path, from, to);
  }
}

}  // namespace vexel_yaml
