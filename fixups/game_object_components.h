#pragma once

#include <set>
#include <unordered_map>
#include <vector>

#include "yaml/type_info.h"

namespace vexel_yaml {

/// A component in a game object's list.
struct Component {
  const YAMLScalar* file_id;
  /// Null for a class that the type information doesn't know.
  const YAMLTypeInfo* type;
};

using ComponentList = std::vector<Component>;

/// The game objects of one file and their components.
struct GameObjectComponents {
  /// File IDs, in file order.
  std::vector<const YAMLScalar*> game_objects;
  /// By file ID, in the order of "m_Component".
  std::unordered_map<const YAMLScalar*, ComponentList> components;
  /// Game objects that components name and that the file doesn't hold.
  std::set<const YAMLScalar*, ScalarTextLess> dangling;

  /// Empty for a game object that is not there.
  const ComponentList& GetComponents(const YAMLScalar* game_object) const;
};

GameObjectComponents CollectGameObjectComponents(const YAMLMapping& root);

}  // namespace vexel_yaml
