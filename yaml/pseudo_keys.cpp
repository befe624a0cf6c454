#include "yaml/pseudo_keys.h"

namespace vexel_yaml {

void AppendPseudoKeys(YAMLMapping& object, const YAMLScalar* file_id, const YAMLScalar* class_id,
                      bool stripped, uint32_t position) {
  const auto append = [&](const YAMLScalar* key, const YAMLScalar* value) {
    object.Append(key, value->AsValue());
    const uint32_t hash =
        YAMLNode::Combine(YAMLNode::Combine(object.GetHash(), key->GetHash()), value->GetHash());
    object.SetHash(YAMLNode::Combine(hash, position++));
  };
  append(YAMLScalar::fileIDPlaceHolderName, file_id);
  append(YAMLScalar::classIDPlaceHolderName, class_id);
  if (stripped) append(YAMLScalar::strippedPrefabPlaceHolderName, YAMLScalar::one);
}

}  // namespace vexel_yaml
