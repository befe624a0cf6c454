#pragma once

#include <string>

#include "diff/yaml_sequence_diff.h"
#include "report/value_text.h"

namespace vexel_yaml {

/// What was done to a list, in words on one line, such as "adds Pier, removes Quay". `base` is the list
/// before, or null where it isn't known. With file IDs, nothing is left out.
std::string ListEditText(const ChangeSequenceOperation& edit, const YAMLNode* base, ObjectNames& names,
                         NamedWith with);

/// A list before these edits, of which each may be null, on one line: what they touched,
/// with dots for the rest.
std::string ListBeforeText(const YAMLSequence& list, const Operation* left, const Operation* right,
                           ObjectNames& names);

}  // namespace vexel_yaml
