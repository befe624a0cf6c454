#include "fixups/post_process.h"

#include "fixups/component_dependencies.h"
#include "fixups/prefab_repairs.h"
#include "fixups/state_machine_transitions.h"
#include "fixups/transform_cycles.h"
#include "fixups/transform_parents.h"
#include "yaml/type_info.h"

namespace vexel_yaml {

void RepairMerged(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                  ConflictResolver& resolver) {
  const FileIDMap in_left = CollectFileIDMap(left);
  const FileIDMap in_right = CollectFileIDMap(right);
  RepairOrphanedPrefabTransforms(merged, in_left, in_right);
  TransformParents parents = RepairTransformParents(merged, in_left, in_right);
  BreakTransformCycles(merged, parents, resolver);
  ClearDanglingPrefabReferences(merged);
}

bool ReportBrokenDependencies(const YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                              ConflictResolver& resolver) {
  if (GetTypeInfoManager().IsEmpty()) return false;
  bool pending = false;
  for (const ComponentDependencyConflict& conflict : FindComponentDependencyConflicts(merged, left, right)) {
    pending |= resolver.OnComponentDependencyConflict(conflict);
  }
  return pending;
}

void PostProcessMergeOnly(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                          ConflictResolver& resolver) {
  RepairMerged(merged, left, right, resolver);
  TransitionsToMappings(merged);
}

bool PostProcess(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                 ConflictResolver& resolver) {
  PostProcessMergeOnly(merged, left, right, resolver);
  return ReportBrokenDependencies(merged, left, right, resolver);
}

}  // namespace vexel_yaml
