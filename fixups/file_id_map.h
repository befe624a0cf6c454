#pragma once

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// The objects of one file by file ID.
///
/// A view of the file's root, which finds an object in constant time: a map of its own would cost as much as
/// the repairs themselves, and would still hold the objects that a repair has removed.
class FileIDMap {
 public:
  bool Contains(const YAMLScalar* file_id) const { return root_->HasKey(file_id); }

  /// The object's document, null where the file has none under this file ID.
  const YAMLMapping* Find(const YAMLScalar* file_id) const {
    const YAMLNode* object = root_->Get(file_id);
    return object == nullptr ? nullptr : object->AsMapping();
  }

 private:
  friend FileIDMap CollectFileIDMap(const YAMLMapping& root);
  explicit FileIDMap(const YAMLMapping& root) : root_(&root) {}

  const YAMLMapping* root_;
};

/// `root` must outlive the map.
inline FileIDMap CollectFileIDMap(const YAMLMapping& root) { return FileIDMap(root); }

}  // namespace vexel_yaml
