#pragma once

#include "merge/conflict_resolver.h"

namespace vexel_yaml {

/// Repairs a merged document so that it loads: orphaned prefab transforms, transform parents that the merge
/// removed, parent cycles (each is reported to the resolver and broken), prefab-internal references to
/// nothing; turns state-machine transitions back into mappings.
/// Throws YAMLError and std::runtime_error as the single repairs do.
void PostProcessMergeOnly(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                          ConflictResolver& resolver);

/// The same and, where type information is loaded, the component dependency checks, whose conflicts the
/// resolver gets. Returns whether one of them is pending.
bool PostProcess(YAMLMapping& merged, const YAMLMapping& left, const YAMLMapping& right,
                 ConflictResolver& resolver);

}  // namespace vexel_yaml
