#pragma once

#include "rules/yaml_sequence_remapper.h"

namespace vexel_yaml {

/// Whether two values at `path` count as unchanged: they have the same text, or are two numbers within the
/// tolerances of the comparison rule for the path.
bool AreSameScalars(const FieldPath& path, const YAMLScalar& a, const YAMLScalar& b);

}  // namespace vexel_yaml
