#pragma once

#include <string>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// Throws YAMLError when a mapping of the file repeats a key, other than the transitions of a state machine:
/// a copy of such a mapping would be empty, so merging it would lose it. The message names `path` and the
/// object.
void RefuseDuplicateKeys(const VexelObjects& objects, const std::string& path);

/// Throws that YAMLError for an object.
[[noreturn]] void ThrowDuplicateKeys(const std::string& path, const YAMLScalar* object);

}  // namespace vexel_yaml
