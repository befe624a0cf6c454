#pragma once

#include <map>
#include <string>
#include <unordered_map>
#include <vector>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// What people call the objects of an asset, where they only carry file IDs.
///
/// Several versions of it can be asked at once: each object is looked up in the first one that holds it. The
/// versions must stay unchanged. A hierarchy with gaps or loops gives shorter paths.
class ObjectNames {
 public:
  explicit ObjectNames(std::vector<const VexelObjects*> versions) : versions_(std::move(versions)) {}

  /// The object's class, such as "Light", or that of its script; empty for an unknown object.
  std::string GetClass(const YAMLScalar* file_id) const;

  /// The guid of the script that the object is an instance of; empty for any other object.
  std::string GetScriptGuid(const YAMLScalar* file_id) const;

  /// Makes the instances of these scripts, by guid, go by their classes.
  void SetScriptClasses(std::map<std::string, std::string> classes) { script_classes_ = std::move(classes); }

  /// The class of a script, empty for one that isn't known.
  std::string GetScriptClass(const std::string& guid) const;

  /// What people take the object for a part of: a component's game object, the prefab instance that brought
  /// it along, or else the object itself.
  const YAMLScalar* GetWhole(const YAMLScalar* file_id) const;

  /// The name that the object itself has; empty for none.
  std::string GetOwnName(const YAMLScalar* file_id) const;

  /// The game object, or else the prefab instance, that the object is a part of; for any other object itself.
  const YAMLScalar* GetOwner(const YAMLScalar* file_id) const;

  /// The name of the game object that a component belongs to; empty for none.
  std::string GetOwnerName(const YAMLScalar* file_id) const;

  /// Where people find the object: the names down to its game object, joined by "/", or its own name. Empty
  /// where nothing is named.
  const std::string& GetPath(const YAMLScalar* file_id);

  /// Path and class in a few words, such as "Light of Harbour/Pier"; game objects and transforms, which stand
  /// for their place, go by the path alone. Empty for an unknown object.
  std::string Describe(const YAMLScalar* file_id);

 private:
  /// The object's fields, null for an unknown object.
  const YAMLMapping* Body(const YAMLScalar* file_id) const;
  const YAMLScalar* TransformOf(const YAMLScalar* game_object) const;
  const YAMLScalar* ParentOf(const YAMLScalar* transform) const;
  std::string TransformPath(const YAMLScalar* transform);
  std::string FindPath(const YAMLScalar* file_id);

  /// A transform's part of the paths that lead by it.
  struct Step {
    std::string name;
    const YAMLScalar* parent;
  };
  const Step& StepAt(const YAMLScalar* transform);

  std::vector<const VexelObjects*> versions_;
  std::unordered_map<const YAMLScalar*, Step> steps_;
  std::unordered_map<const YAMLScalar*, std::string> paths_;
  std::map<std::string, std::string> script_classes_;
};

/// The file ID of a reference within the file, null for any other value and for a reference to nothing.
const YAMLScalar* LocalReference(const YAMLNode* value);

}  // namespace vexel_yaml
