#pragma once

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Whether the edit that made `to` of `from`, both at `path`, may be merged field by field with another one.
/// Values written in braces, such as vectors, are units unless they are references or a rule says otherwise.
bool IsMergeableMapping(const FieldPath& path, const YAMLMapping& from, const YAMLMapping& to);

}  // namespace vexel_yaml
