#pragma once

#include "fixups/file_id_map.h"

namespace vexel_yaml {

/// Where the merge removed the prefab object of a transform: unlinks the transform from it, or removes the
/// transform where its game object is gone, too.
void RepairOrphanedPrefabTransforms(YAMLMapping& merged, const FileIDMap& left, const FileIDMap& right);

/// Sets every prefab-internal reference to an object that the file doesn't hold to "0", and removes stripped
/// transforms that held one.
void ClearDanglingPrefabReferences(YAMLMapping& merged);

}  // namespace vexel_yaml
