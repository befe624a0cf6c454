#include "fixups/post_process.h"

#include "fixups/prefab_repairs.h"
#include "fixups/state_machine_transitions.h"
#include "fixups/transform_cycles.h"
#include "fixups/transform_parents.h"

namespace vexel_yaml {

void PostProcessMergeOnly(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                          ConflictResolver& resolver) {
  RepairOrphanedPrefabTransforms(merged, left, right);
  TransformParents parents = RepairTransformParents(merged, left, right);
  BreakTransformCycles(merged, parents, resolver);
  ClearDanglingPrefabReferences(merged);
  TransitionsToMappings(merged);
}

}  // namespace vexel_yaml
