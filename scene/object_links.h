#pragma once

#include <cstdint>
#include <functional>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// What an object says of its place in the scene.
struct ObjectLinks {
  enum class Kind : uint8_t {
    kGameObject,
    kTransform,
    kComponent,       ///< Any other part of a game object.
    kPrefabInstance,  ///< Has a father, too.
    kOther,           ///< Stands for itself, as settings and assets do.
  };

  Kind kind = Kind::kOther;
  bool is_stripped = false;
  /// The class name, under which the fields stand; null for an object without.
  const YAMLScalar* body_key = nullptr;
  /// What it is a part of: a component's game object, or, of a stripped object, the prefab instance.
  const YAMLScalar* owner = nullptr;
  /// What it hangs below: a transform, or, for a stripped transform, its prefab instance. Null at the top.
  const YAMLScalar* father = nullptr;

  bool HasFather() const { return kind == Kind::kTransform || kind == Kind::kPrefabInstance; }
};

/// Reads them off an object. `object` may be null, which says nothing.
ObjectLinks ReadLinks(const YAMLNode* object);

/// The father of an object in one version, null at the top and for an object that the version lacks.
const YAMLScalar* FatherIn(const VexelObjects& objects, const YAMLScalar* node);

/// The fields of an object, null where it has none.
const YAMLMapping* GetBody(const YAMLNode* object);
YAMLMapping* GetBody(YAMLNode* object);

/// The reference that names the father, null where the object has none of its own.
YAMLMapping* GetFatherReference(YAMLNode* object);

/// The file ID of a reference within the file, null for any other value and for a reference to nothing.
const YAMLScalar* GetLocalTarget(const YAMLNode* value);

/// Calls `visit` with every reference to another object of the file at and below `node`.
void VisitReferences(YAMLNode* node, const std::function<void(YAMLMapping& reference)>& visit);

/// Whether what stands at `path`, which begins with a file ID, says where such an object hangs or follows
/// from what other objects say: its father, its children or components, its place among its siblings. Fields
/// of other objects may bear these names and mean anything.
bool IsLink(const FieldPath& path, ObjectLinks::Kind kind);

/// The keys of the lists that follow from what the listed objects say themselves.
const YAMLScalar* ChildrenKey();
/// The place among these, in files that say it twice.
const YAMLScalar* RootOrderKey();

}  // namespace vexel_yaml
