#pragma once

#include <functional>
#include <map>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// The names of assets' files, such as "Brick.mat", by the guids that objects refer to them with.
using AssetNames = std::map<std::string, std::string>;
/// Finds the names of assets; those that aren't found are missing.
using AssetSearch = std::function<AssetNames(const std::set<std::string>& guids)>;

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

  /// Makes other assets, by guid, go by the names of their files, and the instances of scripts by their
  /// classes, which have the files' names.
  void SetAssetNames(AssetNames names) { asset_names_ = std::move(names); }

  /// The class of a script, empty for one that isn't known.
  std::string GetScriptClass(const std::string& guid) const;
  /// The name of another asset, for a script its class; empty for one that isn't known.
  std::string GetAssetName(const std::string& guid) const;

  /// What people take the object for a part of: a component's game object, the prefab instance that brought
  /// it along, or else the object itself.
  const YAMLScalar* GetWhole(const YAMLScalar* file_id) const;

  /// What that hangs on, again as a whole; null for nothing.
  const YAMLScalar* GetParent(const YAMLScalar* file_id) const;

  /// The name that the object itself has; empty for none.
  std::string GetOwnName(const YAMLScalar* file_id) const;

  /// The game object, or else the prefab instance, that the object is a part of; for any other object itself.
  const YAMLScalar* GetOwner(const YAMLScalar* file_id) const;

  /// The name of the game object that a component belongs to; empty for none.
  std::string GetOwnerName(const YAMLScalar* file_id) const;

  /// Where people find the object: the names down to its game object, joined by "/", or its own name. Empty
  /// where nothing is named.
  const std::string& GetPath(const YAMLScalar* file_id);

  /// Path and class in a few words, such as "Harbour/Pier > Light"; game objects and transforms, which stand
  /// for their place, go by the path alone. Empty for an unknown object.
  std::string Describe(const YAMLScalar* file_id);

  /// What people call what a reference leads to, "none" for nothing. Empty for something unknown, and for a
  /// value that is no reference.
  std::string DescribeTarget(const YAMLNode* reference);

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
  AssetNames asset_names_;
};

/// For what is shown of one version among others: the names that are the same for all of them, so that exact
/// texts can be compared, and those that this version has, for people.
struct CellNames {
  ObjectNames& common;
  ObjectNames& own;
};

/// Whether a value is a reference and nothing more: an element of a list may hold a file ID among other
/// fields.
bool IsReference(const YAMLNode* value);

/// The reference that an element of a list consists of, as it is or, as in a list of components, under a name
/// of its own; else null.
const YAMLNode* ReferenceIn(const YAMLNode* element);

/// Adds the guids of the assets that a value refers to.
void CollectGuids(const YAMLNode* value, std::set<std::string>& guids);

/// The file ID of a reference within the file, null for any other value and for a reference to nothing.
const YAMLScalar* LocalReference(const YAMLNode* value);

}  // namespace vexel_yaml
