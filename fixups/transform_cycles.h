#pragma once

#include "fixups/transform_parents.h"
#include "merge/conflict_resolver.h"

namespace vexel_yaml {

/// Reports and breaks every loop of transform parents: first at the transforms that the resolver
/// collected, then at any other transform, in file order. Throws
/// std::runtime_error where a collected transform is not in the file or a walk up from it meets a transform
/// without a recorded parent.
void BreakTransformCycles(YAMLMapping& merged, TransformParents& parents, ConflictResolver& resolver);

}  // namespace vexel_yaml
