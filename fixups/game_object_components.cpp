#include "fixups/game_object_components.h"

#include "fixups/engine_keys.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

const YAMLTypeInfo* TypeOf(const YAMLMapping& root, const YAMLScalar* file_id) {
  const YAMLScalar* class_id = GetMappingPath(root, file_id, YAMLScalar::classIDPlaceHolderName);
  return class_id == nullptr ? nullptr : GetTypeInfoManager().GetTypeInfo(class_id);
}

// The elements of "m_Component" are mappings of one entry, whatever its name, around a reference.
ComponentList ReadComponents(const YAMLMapping& root, const YAMLMapping& game_object) {
  ComponentList components;
  const YAMLNode* value = game_object.Get(YAMLScalar::mComponent);
  const YAMLSequence* list = value == nullptr ? nullptr : value->AsSequence();
  if (list == nullptr) return components;
  for (const YAMLNode* item : list->GetItems()) {
    const YAMLMapping* entry = item == nullptr ? nullptr : item->AsMapping();
    if (entry == nullptr || entry->HasDuplicateKeys() || entry->Size() != 1) continue;
    const YAMLScalar* file_id = GetMappingPath(*entry, entry->FirstKey(), YAMLScalar::fileID);
    if (file_id != nullptr) components.push_back({file_id, TypeOf(root, file_id)});
  }
  return components;
}

// The game object that another object's document names; a reference with a "guid" leads out of the file.
const YAMLScalar* NamedGameObject(const YAMLMapping& object) {
  const YAMLMapping* body = GetSubmapping(object, object.FirstKey());
  const YAMLMapping* reference = body == nullptr ? nullptr : GetSubmapping(*body, YAMLScalar::mGameObject);
  if (reference == nullptr || reference->HasDuplicateKeys() || reference->HasKey(YAMLScalar::guid))
    return nullptr;
  const YAMLNode* file_id = reference->Get(YAMLScalar::fileID);
  return file_id == nullptr ? nullptr : file_id->AsScalar();
}

}  // namespace

const ComponentList& GameObjectComponents::GetComponents(const YAMLScalar* game_object) const {
  static const ComponentList none;
  const auto found = components.find(game_object);
  return found == components.end() ? none : found->second;
}

GameObjectComponents CollectGameObjectComponents(const YAMLMapping& root) {
  GameObjectComponents collected;
  for (const auto& [key, value] : root) {
    const YAMLMapping* object = value->AsMapping();
    if (object == nullptr || object->HasDuplicateKeys()) continue;
    if (const YAMLMapping* body = GetSubmapping(*object, YAMLScalar::gameObject)) {
      const YAMLScalar* file_id = object->Get(YAMLScalar::fileIDPlaceHolderName)->AsScalar();
      collected.game_objects.push_back(file_id);
      collected.components[file_id] = ReadComponents(root, *body);
    } else if (const YAMLScalar* game_object = NamedGameObject(*object); !IsNullReference(game_object)) {
      collected.dangling.insert(game_object);
    }
  }
  std::erase_if(collected.dangling, [&](const YAMLScalar* id) { return collected.components.contains(id); });
  return collected;
}

}  // namespace vexel_yaml
