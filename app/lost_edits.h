#pragma once

#include <string>

#include "merge/recording_conflict_resolver.h"
#include "yaml/yaml_node.h"

namespace vexel_yaml {

/// What a node holds, as a text without the order of keys, elements and objects. Empty for null.
std::string Content(const YAMLNode* node);

/// Whether `merged` lacks something that only `side` changed, below the roots of three versions, though no
/// conflict stands there: a field, an object, or an element of a list that both sides edited. The elements
/// are told apart by the rules' keys where all have one, else by what they hold. A list whose edits the merge
/// counts as equal is excused: where it lacks something, it is added to `*excused` and not to the answer.
bool IsAnythingLost(const YAMLNode& base, const YAMLNode& side, const YAMLNode& other, const YAMLNode& merged,
                    const RecordingConflictResolver& resolver, size_t* excused = nullptr);

}  // namespace vexel_yaml
