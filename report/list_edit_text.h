#pragma once

#include <string>

#include "diff/yaml_sequence_diff.h"
#include "report/value_text.h"

namespace vexel_yaml {

/// What was done to a list, in words on one line, such as "adds Pier, removes Quay". `base` is the list
/// before, or null where it isn't known. With file IDs, nothing is left out.
std::string ListEditText(const ChangeSequenceOperation& edit, const YAMLNode* base, ObjectNames& names,
                         NamedWith with);

}  // namespace vexel_yaml
