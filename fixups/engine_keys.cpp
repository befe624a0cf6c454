#include "fixups/engine_keys.h"

#include "yaml/folded_object.h"

namespace vexel_yaml {

const YAMLScalar* AnimatorStateMachineKey() {
  static const YAMLScalar* const key = YAMLScalar::Lookup("AnimatorStateMachine");
  return key;
}

const YAMLScalar* StateMachineTransitionsKey() {
  static const YAMLScalar* const key = YAMLScalar::Lookup("m_StateMachineTransitions");
  return key;
}

const YAMLMapping* GetSubmapping(const YAMLMapping& mapping, const YAMLScalar* key) {
  const YAMLNode* value = mapping.HasDuplicateKeys() ? nullptr : mapping.Get(key);
  return value == nullptr ? nullptr : value->AsMapping();
}

YAMLMapping* GetSubmapping(YAMLMapping& mapping, const YAMLScalar* key) {
  return const_cast<YAMLMapping*>(GetSubmapping(std::as_const(mapping), key));
}

const YAMLScalar* GetMappingPath(const YAMLMapping& mapping, const YAMLScalar* first,
                                 const YAMLScalar* second) {
  const YAMLMapping* nested = GetSubmapping(mapping, first);
  const YAMLNode* value = nested == nullptr || nested->HasDuplicateKeys() ? nullptr : nested->Get(second);
  return value == nullptr ? nullptr : value->AsScalar();
}

const YAMLScalar* GetMappingPath(const YAMLMapping& mapping, const YAMLScalar* first,
                                 const YAMLScalar* second, const YAMLScalar* third,
                                 const YAMLScalar* fourth) {
  const YAMLMapping* nested = GetSubmapping(mapping, first);
  if (nested != nullptr) nested = GetSubmapping(*nested, second);
  return nested == nullptr ? nullptr : GetMappingPath(*nested, third, fourth);
}

YAMLMapping* GetTransformBody(YAMLMapping& object) {
  YAMLMapping* body = GetSubmapping(object, YAMLScalar::transform);
  return body != nullptr ? body : GetSubmapping(object, YAMLScalar::rectTransform);
}

bool SurelyRefersToNoPrefab(const YAMLNode& object) {
  const FoldedObject* folded = GetFolded(&object);
  return folded != nullptr && !folded->refers_to_prefab;
}

}  // namespace vexel_yaml
