#pragma once

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Where the merge removed the prefab object of a transform: unlinks the transform from it, or removes the
/// transform where its game object is gone, too.
void RepairOrphanedPrefabTransforms(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right);

/// Sets every prefab-internal reference to an object that the file doesn't hold to "0", and removes stripped
/// transforms that held one.
void ClearDanglingPrefabReferences(YAMLMapping& merged);

}  // namespace vexel_yaml
