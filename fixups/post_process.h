#pragma once

#include "merge/conflict_resolver.h"

namespace vexel_yaml {

/// Repairs a merged document so that it loads: orphaned prefab transforms, transform parents that the merge
/// removed, parent cycles (each is reported to the resolver and broken), prefab-internal references to
/// nothing. Throws YAMLError and std::runtime_error as the single repairs do.
void RepairMerged(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                  ConflictResolver& resolver);

/// Where type information is loaded, gives the resolver the component dependencies that the merge breaks.
/// Returns whether one of them is pending.
bool ReportBrokenDependencies(const YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                              ConflictResolver& resolver);

/// Repairs a merged document and turns state-machine transitions back into mappings. Throws what both throw.
void PostProcessMergeOnly(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                          ConflictResolver& resolver);

/// The same and the component dependency checks. Returns whether a broken one is pending.
bool PostProcess(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                 ConflictResolver& resolver);

}  // namespace vexel_yaml
