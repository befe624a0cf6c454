#pragma once

#include <cstdint>
#include <unordered_map>
#include <vector>

#include "yaml/yaml_node.h"

namespace vexel_yaml {

/// Fingerprints of trees, for where structural hashes are equal and contents are not: nodes with the same
/// content (styles don't count) have the same digest, others practically never, whoever made them. Every
/// node is looked at once, so nothing may be edited meanwhile. Digests mean nothing outside the process.
class ContentDigests {
 public:
  /// `node` may be null: an empty slot.
  uint64_t Of(const YAMLNode* node);

 private:
  // Of mappings and sequences.
  std::unordered_map<const YAMLNode*, uint64_t> known_;
  // The digests of the children of all nodes that are being looked at.
  std::vector<uint64_t> parts_;
};

}  // namespace vexel_yaml
