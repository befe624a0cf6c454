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

  /// `first_line`: what to add to libyaml's line numbers. `keeps_equal_pairs`: whether a pair that is
  /// repeated with an equal value stays, as a repeated key.
  DocumentConverter(yaml_document_t& document, size_t first_line, bool keeps_equal_pairs);

  /// The tree below `node`, owned by the caller. Repeated keys follow the rules of YAMLMapping; a pair whose
  /// key is no scalar is left out. Throws YAMLError "YAML alias contains itself" or
  /// "YAML nesting is deeper than 1000 levels". How far aliases may expand is the business of
  /// CheckDocumentLimits.
  YAMLNode* Convert(yaml_node_t* node);

  bool FoundDuplicateKeys() const { return found_duplicate_keys_; }

  /// libyaml's 0-based lines where left-out keys start.
  const std::vector<size_t>& GetSkippedKeyLines() const { return skipped_key_lines_; }

 private:
  YAMLNode* YAMLDocNodeToScalar(const yaml_node_t* node);
  YAMLNode* YAMLDocNodeToMapping(const yaml_node_t* node);
  YAMLNode* YAMLDocNodeToSequence(const yaml_node_t* node);
  void SetLine(const YAMLNode& converted, const yaml_node_t& node) const {
    converted.SetLine(static_cast<uint32_t>(first_line_ + node.start_mark.line));
  }
  YAMLNode* ConvertById(int id) { return Convert(yaml_document_get_node(&document_, id)); }

  yaml_document_t& document_;
  const size_t first_line_;
  const bool keeps_equal_pairs_;
  // By node id: whether the node is being converted, that is, stands above the current one.
  std::vector<bool> open_;
  size_t depth_ = 0;
  bool found_duplicate_keys_ = false;
  std::vector<size_t> skipped_key_lines_;
};

}  // namespace vexel_yaml
