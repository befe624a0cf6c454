#pragma once

#include <unordered_map>
#include <vector>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// One thing that one side deleted, with all that went with it: a game object with its transform, its
/// components and all below it, a prefab instance with its stripped objects, a component, or an object that
/// stands for itself.
struct Deletion {
  /// The topmost: what somebody clicked on to delete it.
  const YAMLScalar* thing;
  std::vector<const YAMLScalar*> objects;  ///< All of them, in base's order.
};

/// What one side deleted, in base's order.
class Deletions {
 public:
  static constexpr size_t kNone = static_cast<size_t>(-1);

  /// `removed`: the objects of base that the side lacks, in base's order.
  Deletions(const VexelObjects& base, const std::vector<const YAMLScalar*>& removed);

  const std::vector<Deletion>& Get() const { return deletions_; }

  /// The place of the deletion that the object went with, `kNone` for one that is still there.
  size_t Find(const YAMLScalar* file_id) const;

 private:
  std::vector<Deletion> deletions_;
  std::unordered_map<const YAMLScalar*, size_t> places_;
};

}  // namespace vexel_yaml
