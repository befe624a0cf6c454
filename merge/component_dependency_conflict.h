#pragma once

#include "merge/conflict_type.h"
#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

/// A dependency between components that only the merge has broken.
struct ComponentDependencyConflict {
  /// File IDs; the one that is not null names the object concerned.
  const YAMLScalar* first;
  const YAMLScalar* second;
  int count;
  ConflictType type;
};

}  // namespace vexel_yaml
