#pragma once

#include <array>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "scene/scene_documents.h"

namespace vexel_yaml {

/// The objects that a safe merge may change, in groups that have nothing to do with one another: whatever is
/// chosen in one, the others stay as they are. Parts of one game object are in one group.
class EditGroups {
 public:
  using Group = std::vector<const YAMLScalar*>;

  /// `scene` is copied to be looked at.
  explicit EditGroups(const SceneDocuments& scene);

  /// Null for an object that no merge changes.
  const Group* Find(const YAMLScalar* file_id) const;

 private:
  using Versions = std::array<const VexelObjects*, 3>;

  // These find what has to do with one another. The first adds the holders of what moved to `members`.
  void JoinLinked(const Versions& versions, Group& members);
  void JoinReferring(const Versions& versions, const Group& members);
  void JoinCircles(const Versions& versions);

  // Any object of the tree that stands for the group.
  const YAMLScalar* Root(const YAMLScalar* file_id);
  void Join(const YAMLScalar* a, const YAMLScalar* b) { above_[Root(a)] = Root(b); }

  // A disjoint-set forest, and what came of it.
  std::unordered_map<const YAMLScalar*, const YAMLScalar*> above_;
  std::unordered_set<const YAMLScalar*> moved_;
  std::unordered_map<const YAMLScalar*, Group> groups_;
  std::unordered_map<const YAMLScalar*, const Group*> group_of_;
};

}  // namespace vexel_yaml
