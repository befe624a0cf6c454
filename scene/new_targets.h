#pragma once

#include <unordered_set>

#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

/// The objects of the file that an object refers to where it did not in base: in another field, in another
/// element of a list, however the elements were moved. Where elements can't be told apart, what it refers to
/// more often. `base` is null for an object that base lacks.
std::unordered_set<const YAMLScalar*> FindNewTargets(const YAMLScalar* file_id, const YAMLNode* base,
                                                     const YAMLNode* object);

}  // namespace vexel_yaml
