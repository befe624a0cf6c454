#include "report/object_names.h"

#include <algorithm>
#include <unordered_set>

#include "fixups/engine_keys.h"
#include "report/value_text.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// Longer paths would tell nobody anything, and cost much where thousands of objects have one.
constexpr size_t kMostNames = 50;
constexpr size_t kMostOfName = 100;
constexpr std::string_view kScriptSuffix = ".cs";

const YAMLScalar* NameKey() {
  static const YAMLScalar* const key = YAMLScalar::Lookup("m_Name");
  return key;
}

bool IsTransform(std::string_view name) { return name == "Transform" || name == "RectTransform"; }

const YAMLNode* Field(const YAMLMapping* mapping, const YAMLScalar* key) {
  return mapping == nullptr || mapping->HasDuplicateKeys() ? nullptr : mapping->Get(key);
}

std::string TextOf(const YAMLNode* value) {
  const YAMLScalar* scalar = value == nullptr ? nullptr : value->AsScalar();
  return scalar == nullptr ? std::string() : scalar->GetText();
}

const YAMLScalar* ReferenceAt(const YAMLMapping* body, const YAMLScalar* key) {
  return LocalReference(Field(body, key));
}

const YAMLMapping* Modification(const YAMLMapping* body) {
  const YAMLNode* value = Field(body, YAMLScalar::mModification);
  return value == nullptr ? nullptr : value->AsMapping();
}

// The name that a prefab instance gives to its root, where it gives one.
std::string ModifiedName(const YAMLMapping* body) {
  static const YAMLScalar* const modifications = YAMLScalar::Lookup("m_Modifications");
  static const YAMLScalar* const property_path = YAMLScalar::Lookup("propertyPath");
  static const YAMLScalar* const value_key = YAMLScalar::Lookup("value");
  const YAMLNode* list = Field(Modification(body), modifications);
  if (list == nullptr || list->AsSequence() == nullptr) return {};
  for (const YAMLNode* item : list->AsSequence()->GetItems()) {
    const YAMLMapping* entry = item == nullptr ? nullptr : item->AsMapping();
    if (Field(entry, property_path) == NameKey()) return TextOf(Field(entry, value_key));
  }
  return {};
}

}  // namespace

const YAMLScalar* LocalReference(const YAMLNode* value) {
  const YAMLMapping* reference = value == nullptr ? nullptr : value->AsMapping();
  const YAMLNode* file_id = Field(reference, YAMLScalar::fileID);
  // With a "guid" it leads into another file.
  if (file_id == nullptr || Field(reference, YAMLScalar::guid) != nullptr) return nullptr;
  return IsNullReference(file_id->AsScalar()) ? nullptr : file_id->AsScalar();
}

bool IsReference(const YAMLNode* value) {
  const YAMLMapping* mapping = value == nullptr ? nullptr : value->AsMapping();
  if (mapping == nullptr || mapping->GetFolded() != nullptr || mapping->HasDuplicateKeys()) return false;
  const YAMLNode* file_id = mapping->Get(YAMLScalar::fileID);
  const YAMLNode* guid = mapping->Get(YAMLScalar::guid);
  if (file_id == nullptr || file_id->AsScalar() == nullptr || mapping->Size() > 3) return false;
  return guid == nullptr ? mapping->Size() == 1 : guid->AsScalar() != nullptr;
}

const YAMLNode* ReferenceIn(const YAMLNode* element) {
  if (IsReference(element)) return element;
  const YAMLMapping* entry = element == nullptr ? nullptr : element->AsMapping();
  if (entry == nullptr || entry->HasDuplicateKeys() || entry->Size() != 1) return nullptr;
  return IsReference(entry->First()) ? entry->First() : nullptr;
}

void CollectGuids(const YAMLNode* value, std::set<std::string>& guids) {
  if (value == nullptr) return;
  if (const YAMLSequence* list = value->AsSequence()) {
    for (const YAMLNode* item : list->GetItems()) CollectGuids(item, guids);
  } else if (IsReference(value)) {
    const std::string guid = TextOf(value->AsMapping()->Get(YAMLScalar::guid));
    if (!guid.empty()) guids.insert(guid);
  } else if (const YAMLMapping* mapping = value->AsMapping();
             mapping != nullptr && mapping->GetFolded() == nullptr && !mapping->HasDuplicateKeys()) {
    for (const YAMLMapping::Slot& slot : *mapping) CollectGuids(slot.value, guids);
  }
}

const YAMLMapping* ObjectNames::Body(const YAMLScalar* file_id) const {
  for (const VexelObjects* version : versions_) {
    const YAMLMapping* object = GetSubmapping(*version, file_id);
    if (object != nullptr && !object->HasDuplicateKeys()) return GetSubmapping(*object, object->FirstKey());
  }
  return nullptr;
}

std::string ObjectNames::GetScriptGuid(const YAMLScalar* file_id) const {
  static const YAMLScalar* const script_key = YAMLScalar::Lookup("m_Script");
  const YAMLNode* script = Field(Body(file_id), script_key);
  return script == nullptr ? std::string() : TextOf(Field(script->AsMapping(), YAMLScalar::guid));
}

std::string ObjectNames::GetClass(const YAMLScalar* file_id) const {
  if (!asset_names_.empty()) {
    std::string script = GetScriptClass(GetScriptGuid(file_id));
    if (!script.empty()) return script;
  }
  for (const VexelObjects* version : versions_) {
    const YAMLMapping* object = GetSubmapping(*version, file_id);
    if (object == nullptr || object->HasDuplicateKeys()) continue;
    const YAMLScalar* key = object->FirstKey();
    return key->IsPseudoKey() ? std::string() : key->GetText();
  }
  return {};
}

std::string ObjectNames::GetScriptClass(const std::string& guid) const {
  const auto found = asset_names_.find(guid);
  if (found == asset_names_.end() || !found->second.ends_with(kScriptSuffix)) return {};
  return found->second.substr(0, found->second.size() - kScriptSuffix.size());
}

std::string ObjectNames::GetAssetName(const std::string& guid) const {
  std::string script = GetScriptClass(guid);
  if (!script.empty()) return script;
  const auto found = asset_names_.find(guid);
  return found == asset_names_.end() ? std::string() : found->second;
}

const YAMLScalar* ObjectNames::GetWhole(const YAMLScalar* file_id) const {
  const YAMLScalar* game_object = ReferenceAt(Body(file_id), YAMLScalar::mGameObject);
  if (game_object != nullptr && Body(game_object) != nullptr) file_id = game_object;
  const YAMLScalar* instance = ReferenceAt(Body(file_id), YAMLScalar::mPrefabInstance);
  return instance != nullptr && Body(instance) != nullptr ? instance : file_id;
}

std::string ObjectNames::GetOwnName(const YAMLScalar* file_id) const {
  const YAMLMapping* body = Body(file_id);
  const std::string name = TextOf(Field(body, NameKey()));
  return name.empty() ? ModifiedName(body) : name;
}

const YAMLScalar* ObjectNames::GetOwner(const YAMLScalar* file_id) const {
  const YAMLScalar* game_object = ReferenceAt(Body(file_id), YAMLScalar::mGameObject);
  if (game_object != nullptr) return game_object;
  // What a prefab instance brings along names no game object of this file.
  const YAMLScalar* instance = ReferenceAt(Body(file_id), YAMLScalar::mPrefabInstance);
  return instance == nullptr ? file_id : instance;
}

std::string ObjectNames::GetOwnerName(const YAMLScalar* file_id) const {
  const YAMLScalar* owner = GetOwner(file_id);
  return owner == file_id ? std::string() : GetOwnName(owner);
}

// The elements of "m_Component" are mappings of one entry, whatever its name, around a reference.
const YAMLScalar* ObjectNames::TransformOf(const YAMLScalar* game_object) const {
  const YAMLNode* components = Field(Body(game_object), YAMLScalar::mComponent);
  if (components == nullptr || components->AsSequence() == nullptr) return nullptr;
  for (const YAMLNode* item : components->AsSequence()->GetItems()) {
    const YAMLMapping* entry = item == nullptr ? nullptr : item->AsMapping();
    if (entry == nullptr || entry->HasDuplicateKeys() || entry->Size() != 1) continue;
    const YAMLScalar* component = LocalReference(entry->First());
    if (component == nullptr) continue;
    if (IsTransform(GetClass(component))) return component;
  }
  return nullptr;
}

const YAMLScalar* ObjectNames::ParentOf(const YAMLScalar* transform) const {
  const YAMLMapping* body = Body(transform);
  if (Field(body, YAMLScalar::mFather) != nullptr) return ReferenceAt(body, YAMLScalar::mFather);
  const YAMLScalar* instance = ReferenceAt(body, YAMLScalar::mPrefabInstance);
  const YAMLMapping* prefab = instance == nullptr ? body : Body(instance);
  return ReferenceAt(Modification(prefab), YAMLScalar::mTransformParent);
}

const YAMLScalar* ObjectNames::GetParent(const YAMLScalar* file_id) const {
  const YAMLScalar* whole = GetWhole(file_id);
  const YAMLScalar* transform = TransformOf(whole);
  const YAMLScalar* parent = ParentOf(transform == nullptr ? whole : transform);
  return parent == nullptr ? nullptr : GetWhole(parent);
}

const ObjectNames::Step& ObjectNames::StepAt(const YAMLScalar* transform) {
  const auto [entry, is_new] = steps_.try_emplace(transform);
  if (is_new) {
    std::string name = GetOwnName(transform);
    if (name.empty()) name = GetOwnerName(transform);
    entry->second = {Shortened(name, kMostOfName), ParentOf(transform)};
  }
  return entry->second;
}

std::string ObjectNames::TransformPath(const YAMLScalar* transform) {
  std::vector<std::string_view> names;
  std::unordered_set<const YAMLScalar*> seen;
  while (transform != nullptr && seen.insert(transform).second) {
    const Step& step = StepAt(transform);
    if (step.name.empty()) break;
    if (names.size() == kMostNames) {
      names.emplace_back(kEllipsis);
      break;
    }
    names.push_back(step.name);
    transform = step.parent;
  }
  std::ranges::reverse(names);
  std::string path;
  for (const std::string_view name : names) {
    if (!path.empty()) path += '/';
    path += name;
  }
  return path;
}

std::string ObjectNames::FindPath(const YAMLScalar* file_id) {
  const YAMLMapping* body = Body(file_id);
  const YAMLScalar* game_object = ReferenceAt(body, YAMLScalar::mGameObject);
  if (game_object == nullptr && GetClass(file_id) == YAMLScalar::gameObject->GetText()) game_object = file_id;
  const YAMLScalar* transform = game_object == nullptr ? file_id : TransformOf(game_object);
  std::string path = transform == nullptr ? std::string() : TransformPath(transform);
  if (!path.empty()) return path;
  return Shortened(GetOwnName(game_object == nullptr ? file_id : game_object), kMostOfName);
}

const std::string& ObjectNames::GetPath(const YAMLScalar* file_id) {
  const auto [entry, is_new] = paths_.try_emplace(file_id);
  if (is_new) entry->second = FindPath(file_id);
  return entry->second;
}

std::string ObjectNames::Describe(const YAMLScalar* file_id) {
  std::string name = GetClass(file_id);
  const std::string& path = GetPath(file_id);
  if (path.empty()) return name;
  return name.empty() || name == "GameObject" || IsTransform(name) ? path : path + " > " + name;
}

std::string ObjectNames::DescribeTarget(const YAMLNode* reference) {
  if (!IsReference(reference)) return {};
  const YAMLMapping* mapping = reference->AsMapping();
  if (mapping->HasKey(YAMLScalar::guid)) return GetAssetName(TextOf(mapping->Get(YAMLScalar::guid)));
  const YAMLScalar* target = LocalReference(reference);
  return target == nullptr ? "none" : Describe(target);
}

}  // namespace vexel_yaml
