#pragma once

#include <unordered_map>
#include <unordered_set>

#include "fixups/file_id_map.h"

namespace vexel_yaml {

/// The parent links between the transforms of one file.
class TransformParents {
 public:
  /// Records a transform's parent and the reference in the file that names it. Null stands for the "m_Father"
  /// of a transform that nobody has read; `object` is its document.
  void Record(const YAMLScalar* transform, const YAMLScalar* parent, YAMLMapping* reference,
              YAMLMapping* object);

  /// The parent's file ID ("0" or empty for none), null where none is recorded.
  const YAMLScalar* GetParent(const YAMLScalar* transform) const;

  /// Makes a transform with a recorded parent a root, here and in the file: as all that share its reference
  /// (the transforms of one prefab instance).
  void Detach(const YAMLScalar* transform);

 private:
  struct Link {
    const YAMLScalar* parent;
    YAMLMapping* reference;
    YAMLMapping* object;
  };

  std::unordered_map<const YAMLScalar*, Link> links_;
  std::unordered_set<const YAMLMapping*> detached_;
};

/// Sets the parents that the merge removed to "0" and collects the parent links as they were before. Throws
/// YAMLError "Could not determine the transform parent of " + ID.
TransformParents RepairTransformParents(YAMLMapping& merged, const FileIDMap& left, const FileIDMap& right);

}  // namespace vexel_yaml
