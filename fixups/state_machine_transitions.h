#pragma once

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Turns the transitions of every state machine of a file into a sequence of one-pair mappings, since they
/// may repeat keys, which no diff of mappings can express. A state machine that repeats a key of its own is
/// left as it is. Throws YAMLError "Expected key to point to yaml mapping: " + key.
void TransitionsToSequences(YAMLMapping& root);

/// Turns them back. Throws YAMLError "Expected key to point to yaml sequence: " + key, also where there are
/// none, since no command could read such a state machine again, and "Expected size of one for key: " + key.
void TransitionsToMappings(YAMLMapping& root);

/// The same for what stripping left of a file, which may be nothing of the transitions.
void StrippedTransitionsToMappings(YAMLMapping& root);

}  // namespace vexel_yaml
