#pragma once

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Turns the transitions of every state machine of a file into a sequence of one-pair mappings, since they
/// may repeat keys, which no diff of mappings can express. Throws YAMLError "Expected key to point to yaml
/// mapping: " + key.
void TransitionsToSequences(YAMLMapping& root);

/// Turns them back. Throws YAMLError "Expected key to point to yaml sequence: " + key and "Expected size of
/// one for key: " + key.
void TransitionsToMappings(YAMLMapping& root);

}  // namespace vexel_yaml
