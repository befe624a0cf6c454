#pragma once

#include <yaml.h>

#include <cstdint>
#include <vector>

#include "yaml/yaml_node.h"

namespace vexel_yaml {

/// Turns the nodes of one loaded libyaml document into pooled nodes, structural hashes included, so that a
/// tree just read needs no further hashing. The document must outlive the converter.
class DocumentConverter {
 public:
  static constexpr size_t kDeepest = 1000;
  static constexpr size_t kMostNodes = 10'000'000;

  explicit DocumentConverter(yaml_document_t& document);

  /// The tree below `node`, owned by the caller. Repeated keys follow the rules of YAMLMapping; a pair whose
  /// key is no scalar is left out. Throws YAMLError "YAML alias contains itself",
  /// "YAML nesting is deeper than 1000 levels" or "YAML aliases expand to more than 10000000 nodes".
  YAMLNode* Convert(yaml_node_t* node);

  bool FoundDuplicateKeys() const { return found_duplicate_keys_; }

  /// 0-based lines in the document's text where left-out keys start.
  const std::vector<size_t>& GetSkippedKeyLines() const { return skipped_key_lines_; }

 private:
  YAMLNode* YAMLDocNodeToScalar(const yaml_node_t* node);
  YAMLNode* YAMLDocNodeToMapping(const yaml_node_t* node);
  YAMLNode* YAMLDocNodeToSequence(const yaml_node_t* node);
  YAMLNode* ConvertById(int id) { return Convert(yaml_document_get_node(&document_, id)); }

  yaml_document_t& document_;
  // By node id: whether the node is being converted, that is, stands above the current one.
  std::vector<bool> open_;
  size_t depth_ = 0;
  size_t node_count_ = 0;
  bool found_duplicate_keys_ = false;
  std::vector<size_t> skipped_key_lines_;
};

}  // namespace vexel_yaml
