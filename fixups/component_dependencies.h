#pragma once

#include <vector>

#include "merge/component_dependency_conflict.h"
#include "yaml/type_info.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Finds what the merge broke between the components of game objects, judged by the loaded type information:
/// components whose game object one side removed, required components that one side removed, and components
/// that exclude one another and came together only now. Each conflict once.
std::vector<ComponentDependencyConflict> FindComponentDependencyConflicts(const YAMLMapping& merged,
                                                                          const YAMLMapping& left,
                                                                          const YAMLMapping& right);

/// A class and those that it derives from, nearest first, as far as type information tells.
std::vector<const YAMLScalar*> LineageOf(const YAMLTypeInfo& type);

}  // namespace vexel_yaml
