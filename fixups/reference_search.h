#pragma once

#include <bitset>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "platform/text_hash.h"
#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

/// Looks for references to some objects in others without reading them: the text of a folded object tells, so
/// that the rest of a scene stays folded.
class ReferenceSearch {
 public:
  explicit ReferenceSearch(const std::vector<const YAMLScalar*>& file_ids);

  /// Whether an object may refer to one of them. Any that is not folded may.
  bool MayRefer(const YAMLNode& object) const;

 private:
  /// Of the bytes in front of the end of a file ID in the text of a reference.
  static size_t FilterPlace(const char* end);

  std::unordered_set<std::string_view, TextHash> file_ids_;
  // Most references are to other objects, and hashing all of them took longer than finding them.
  std::bitset<65536> filter_;
};

}  // namespace vexel_yaml
