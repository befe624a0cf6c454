#pragma once

#include "merge/conflict_resolver.h"

namespace vexel_yaml {

/// Makes one addition from two added mappings or two added sequences by merging their contents under
/// `resolver`, at its path. Null where the two values are not both mappings or both sequences.
const AddOperation* MergeAddedValues(const AddOperation& left, const AddOperation& right,
                                     ConflictResolver& resolver);

}  // namespace vexel_yaml
