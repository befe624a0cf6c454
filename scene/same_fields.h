#pragma once

#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

/// Whether two nodes at `path`, which is the same again on return, hold the same, so that to turn one into
/// the other is no edit: the order of a mapping's keys doesn't count, nor do styles, nor numbers within the
/// tolerances of comparison rules. Either may be null: nothing stands there.
bool HaveSameFields(FieldPath& path, const YAMLNode* a, const YAMLNode* b);

}  // namespace vexel_yaml
