#include "scene/scene_versions.h"

namespace vexel_yaml {

void SetEntry(YAMLMapping& mapping, const YAMLScalar* key, YAMLNode* value) {
  if (value == nullptr) {
    mapping.Remove(key);
  } else if (mapping.HasKey(key)) {
    mapping.Change(key, value)->Free();
  } else {
    mapping.Insert(key, value);
  }
}

void SceneVersions::SetObject(const YAMLScalar* file_id, const YAMLNode* object) {
  const OwnedNodePtr<YAMLNode> kept(object == nullptr ? nullptr : object->Clone());
  for (VexelObjects* version : {&base, &left, &right}) {
    SetEntry(*version, file_id, kept == nullptr ? nullptr : kept->Clone());
  }
}

}  // namespace vexel_yaml
