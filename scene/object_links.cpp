#include "scene/object_links.h"

#include <optional>
#include <string>
#include <string_view>

#include "fixups/engine_keys.h"
#include "yaml/folded_object.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

using Kind = ObjectLinks::Kind;

Kind KindOf(const YAMLScalar* body_key, const YAMLMapping* body) {
  if (body_key == YAMLScalar::gameObject) return Kind::kGameObject;
  if (body_key == YAMLScalar::transform || body_key == YAMLScalar::rectTransform) return Kind::kTransform;
  if (body_key == YAMLScalar::prefabInstance || body_key == YAMLScalar::prefab) return Kind::kPrefabInstance;
  return body != nullptr && GetLocalTarget(body->Get(YAMLScalar::mGameObject)) != nullptr ? Kind::kComponent
                                                                                          : Kind::kOther;
}

const YAMLScalar* BodyKey(const YAMLMapping& object) {
  if (const FoldedObject* folded = object.GetFolded()) return folded->body_key;
  return object.HasDuplicateKeys() || object.Size() == 0 ? nullptr : object.FirstKey();
}

const YAMLScalar* InstanceOf(const YAMLMapping& body) {
  for (const YAMLScalar* key :
       {YAMLScalar::mPrefabInstance, YAMLScalar::mPrefabInternal, YAMLScalar::mPrefab}) {
    if (const YAMLScalar* instance = GetLocalTarget(body.Get(key))) return instance;
  }
  return nullptr;
}

// The target of the reference that a folded object has at a field, null where it has no such field; nothing
// where only reading it tells.
std::optional<const YAMLScalar*> TargetIn(std::string_view text, const YAMLScalar* key) {
  const std::string& name = key->GetText();
  const size_t found = text.find(name);
  if (found == std::string_view::npos) return nullptr;
  // A field of the body stands at its indent. Elsewhere the name may mean anything.
  constexpr std::string_view kIndent = "\n  ";
  constexpr std::string_view kReference = ": {fileID: ";
  if (found < kIndent.size() || text.substr(found - kIndent.size(), kIndent.size()) != kIndent) {
    return std::nullopt;
  }
  const std::string_view value = text.substr(found + name.size());
  const size_t end = value.find_first_of(",}\n");
  if (!value.starts_with(kReference) || end == std::string_view::npos || value.substr(end, 2) != "}\n") {
    return std::nullopt;
  }
  const YAMLScalar* target = YAMLScalar::Lookup(value.substr(kReference.size(), end - kReference.size()));
  return IsNullReference(target) ? nullptr : target;
}

// Without reading the object, since neighbours of what was edited are asked, too; nothing where that is
// needed.
std::optional<ObjectLinks> LinksOf(const FoldedObject& folded) {
  ObjectLinks links;
  links.body_key = folded.body_key;
  links.is_stripped = folded.stripped;
  links.kind = KindOf(folded.body_key, nullptr);
  if (links.is_stripped || links.kind == Kind::kPrefabInstance) return std::nullopt;
  if (links.kind == Kind::kTransform && folded.father == nullptr) return std::nullopt;
  const std::optional<const YAMLScalar*> owner = TargetIn(folded.text, YAMLScalar::mGameObject);
  if (!owner) return std::nullopt;
  links.owner = *owner;
  if (links.kind == Kind::kOther && links.owner != nullptr) links.kind = Kind::kComponent;
  if (links.kind == Kind::kTransform && !IsNullReference(folded.father)) links.father = folded.father;
  return links;
}

}  // namespace

const YAMLMapping* GetBody(const YAMLNode* object) { return GetBody(const_cast<YAMLNode*>(object)); }

YAMLMapping* GetBody(YAMLNode* object) {
  YAMLMapping* mapping = object == nullptr ? nullptr : object->AsMapping();
  const YAMLScalar* key = mapping == nullptr ? nullptr : BodyKey(*mapping);
  YAMLMapping* body = key == nullptr || key->IsPseudoKey() ? nullptr : GetSubmapping(*mapping, key);
  return body == nullptr || body->HasDuplicateKeys() ? nullptr : body;
}

const YAMLScalar* GetLocalTarget(const YAMLNode* value) {
  const YAMLMapping* reference = value == nullptr ? nullptr : value->AsMapping();
  if (reference == nullptr || reference->GetFolded() != nullptr || reference->HasDuplicateKeys())
    return nullptr;
  const YAMLNode* file_id = reference->Get(YAMLScalar::fileID);
  const YAMLScalar* target = file_id == nullptr ? nullptr : file_id->AsScalar();
  return IsNullReference(target) || reference->HasKey(YAMLScalar::guid) ? nullptr : target;
}

ObjectLinks ReadLinks(const YAMLNode* object) {
  if (const FoldedObject* folded = GetFolded(object)) {
    if (const std::optional<ObjectLinks> links = LinksOf(*folded)) return *links;
  }
  ObjectLinks links;
  const YAMLMapping* body = GetBody(object);
  if (body == nullptr) return links;
  const YAMLMapping& mapping = *object->AsMapping();
  links.body_key = BodyKey(mapping);
  links.kind = KindOf(links.body_key, body);
  links.is_stripped = mapping.HasKey(YAMLScalar::strippedPrefabPlaceHolderName);
  links.owner = links.is_stripped ? InstanceOf(*body) : GetLocalTarget(body->Get(YAMLScalar::mGameObject));
  if (!links.HasFather()) return links;
  if (YAMLMapping* reference = GetFatherReference(const_cast<YAMLNode*>(object))) {
    links.father = GetLocalTarget(reference);
  } else if (links.is_stripped) {
    links.father = links.owner;
  }
  return links;
}

const YAMLScalar* FatherIn(const VexelObjects& objects, const YAMLScalar* node) {
  const YAMLNode* object = objects.Get(node);
  const FoldedObject* folded = GetFolded(object);
  if (folded != nullptr && folded->father != nullptr) {
    return IsNullReference(folded->father) ? nullptr : folded->father;
  }
  return ReadLinks(object).father;
}

YAMLMapping* GetFatherReference(YAMLNode* object) {
  YAMLMapping* body = GetBody(object);
  if (body == nullptr) return nullptr;
  if (YAMLMapping* father = GetSubmapping(*body, YAMLScalar::mFather)) return father;
  YAMLMapping* modification = GetSubmapping(*body, YAMLScalar::mModification);
  return modification == nullptr || modification->HasDuplicateKeys()
             ? nullptr
             : GetSubmapping(*modification, YAMLScalar::mTransformParent);
}

void VisitReferences(YAMLNode* node, const std::function<void(YAMLMapping& reference)>& visit) {
  if (node == nullptr) return;
  if (YAMLMapping* mapping = node->AsMapping()) {
    if (GetLocalTarget(mapping) != nullptr) visit(*mapping);
    if (mapping->HasDuplicateKeys()) return;
    for (const auto& [key, value] : *mapping) VisitReferences(value, visit);
  } else if (YAMLSequence* sequence = node->AsSequence()) {
    for (YAMLNode* item : sequence->GetItems()) VisitReferences(item, visit);
  }
}

bool IsLink(const FieldPath& path, ObjectLinks::Kind kind) {
  switch (kind) {
    case Kind::kTransform:
      return path.size() == 3 &&
             (path[2] == ChildrenKey() || path[2] == RootOrderKey() || path[2] == YAMLScalar::mFather);
    case Kind::kGameObject:
      return path.size() == 3 && path[2] == YAMLScalar::mComponent;
    case Kind::kPrefabInstance:
      return path.size() == 4 && path[2] == YAMLScalar::mModification &&
             path[3] == YAMLScalar::mTransformParent;
    case Kind::kComponent:
    case Kind::kOther:
      break;
  }
  return false;
}

const YAMLScalar* ChildrenKey() {
  static const YAMLScalar* const key = YAMLScalar::Lookup("m_Children");
  return key;
}

const YAMLScalar* RootOrderKey() {
  static const YAMLScalar* const key = YAMLScalar::Lookup("m_RootOrder");
  return key;
}

}  // namespace vexel_yaml
