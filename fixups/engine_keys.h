#pragma once

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Keys of state machines, whose transitions the engine writes as a mapping that may repeat keys.
const YAMLScalar* AnimatorStateMachineKey();
const YAMLScalar* StateMachineTransitionsKey();

/// The scalar reached by following the keys through nested mappings, null if any step is missing or no
/// mapping.
const YAMLScalar* GetMappingPath(const YAMLMapping& mapping, const YAMLScalar* first,
                                 const YAMLScalar* second);
const YAMLScalar* GetMappingPath(const YAMLMapping& mapping, const YAMLScalar* first,
                                 const YAMLScalar* second, const YAMLScalar* third, const YAMLScalar* fourth);

/// The mapping at `key`, null if there is none.
YAMLMapping* GetSubmapping(YAMLMapping& mapping, const YAMLScalar* key);
const YAMLMapping* GetSubmapping(const YAMLMapping& mapping, const YAMLScalar* key);

/// The body of a transform's document, null for other objects.
YAMLMapping* GetTransformBody(YAMLMapping& object);

/// Whether no "m_PrefabInternal" in an object refers to anything, as far as its text tells without reading
/// it: so it is with nearly every object.
bool SurelyRefersToNoPrefab(const YAMLNode& object);

/// Whether a file ID refers to nothing: none, empty or "0".
inline bool IsNullReference(const YAMLScalar* file_id) {
  return file_id == nullptr || file_id == YAMLScalar::zero || file_id == YAMLScalar::empty;
}

}  // namespace vexel_yaml
