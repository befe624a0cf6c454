#pragma once

#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// What each of some objects hangs on, among these: a component on its game object, a stripped object on its
/// prefab instance, a game object and a prefab instance on the transform above.
class Holders {
 public:
  /// `objects`: the version that is asked; those of `among` that it lacks hang on nothing.
  Holders(const VexelObjects& objects, const std::vector<const YAMLScalar*>& among);

  /// Null for what hangs on none of them.
  const YAMLScalar* Get(const YAMLScalar* file_id) const;

 private:
  void Hold(const YAMLScalar* file_id, const YAMLScalar* holder);

  std::unordered_set<const YAMLScalar*> among_;
  std::unordered_map<const YAMLScalar*, const YAMLScalar*> holders_;
};

/// For each of some objects the outermost one of `tops` on which it hangs in the end, itself included; null
/// for none.
std::unordered_map<const YAMLScalar*, const YAMLScalar*> FindTops(
    const Holders& holders, const std::vector<const YAMLScalar*>& objects,
    const std::unordered_set<const YAMLScalar*>& tops);

}  // namespace vexel_yaml
