#pragma once

#include <vector>

#include "rules/yaml_sequence_remapper.h"

namespace vexel_yaml {

/// Reads the keys of a list's elements. Where the first key path leads to a file ID the element is a
/// reference, and a guid beside the file ID is part of its key: one file ID means different objects in
/// different assets.
class ElementKeyReader {
 public:
  /// `key_paths` must outlive the reader.
  explicit ElementKeyReader(const std::vector<FieldPath>& key_paths);

  /// Null where the element, which may be null, has no key.
  const YAMLScalar* Read(const YAMLNode* element) const;

 private:
  const std::vector<FieldPath>& key_paths_;
  FieldPath guid_path_;
};

}  // namespace vexel_yaml
