#include "yaml/convert_document.h"

#include <memory>
#include <string_view>

#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_mapping.h"
#include "yaml/yaml_scalar.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

std::string_view ScalarText(const yaml_node_t* node) {
  return {reinterpret_cast<const char*>(node->data.scalar.value), node->data.scalar.length};
}

}  // namespace

DocumentConverter::DocumentConverter(yaml_document_t& document, size_t first_line, bool keeps_equal_pairs)
    : document_(document),
      first_line_(first_line),
      keeps_equal_pairs_(keeps_equal_pairs),
      open_(static_cast<size_t>(document.nodes.top - document.nodes.start)) {}

YAMLNode* DocumentConverter::Convert(yaml_node_t* node) {
  if (node->type == YAML_SCALAR_NODE) return YAMLDocNodeToScalar(node);

  const auto index = static_cast<size_t>(node - document_.nodes.start);
  if (open_[index]) throw YAMLError("YAML alias contains itself");
  if (depth_ == kDeepest) throw YAMLError("YAML nesting is deeper than 1000 levels");
  open_[index] = true;
  ++depth_;
  YAMLNode* converted =
      node->type == YAML_MAPPING_NODE ? YAMLDocNodeToMapping(node) : YAMLDocNodeToSequence(node);
  --depth_;
  open_[index] = false;
  SetLine(*converted, *node);
  return converted;
}

YAMLNode* DocumentConverter::YAMLDocNodeToScalar(const yaml_node_t* node) {
  const YAMLScalar* scalar = YAMLScalar::Lookup(ScalarText(node));
  SetLine(*scalar, *node);
  return scalar->AsValue();
}

YAMLNode* DocumentConverter::YAMLDocNodeToMapping(const yaml_node_t* node) {
  OwnedNodePtr<YAMLMapping> mapping(
      YAMLAlloc<YAMLMapping>::create(node->data.mapping.style == YAML_FLOW_MAPPING_STYLE));
  const yaml_node_pair_t* begin = node->data.mapping.pairs.start;
  const yaml_node_pair_t* end = node->data.mapping.pairs.top;
  uint32_t hash = 0;
  for (const yaml_node_pair_t* pair = begin; pair != end; ++pair) {
    yaml_node_t* key_node = yaml_document_get_node(&document_, pair->key);
    if (key_node->type != YAML_SCALAR_NODE) {
      skipped_key_lines_.push_back(key_node->start_mark.line);
      continue;
    }
    const YAMLScalar* key = YAMLDocNodeToScalar(key_node)->AsScalar();
    OwnedNodePtr<YAMLNode> value(ConvertById(pair->value));
    hash = YAMLNode::Combine(hash, key->GetHash());
    hash = YAMLNode::Combine(hash, value->GetHash());
    hash = YAMLNode::Combine(hash, static_cast<uint32_t>(pair - begin));
    if (keeps_equal_pairs_) {
      mapping->AppendRepeated(key, value.get());
    } else {
      mapping->Append(key, value.get());
    }
    value.release();
  }
  found_duplicate_keys_ |= mapping->HasDuplicateKeys();
  mapping->SetHash(hash);
  return mapping.release();
}

YAMLNode* DocumentConverter::YAMLDocNodeToSequence(const yaml_node_t* node) {
  OwnedNodePtr<YAMLSequence> sequence(
      YAMLAlloc<YAMLSequence>::create(node->data.sequence.style == YAML_FLOW_SEQUENCE_STYLE));
  const yaml_node_item_t* begin = node->data.sequence.items.start;
  const yaml_node_item_t* end = node->data.sequence.items.top;
  sequence->Reserve(static_cast<size_t>(end - begin));
  uint32_t hash = 0;
  for (const yaml_node_item_t* item = begin; item != end; ++item) {
    YAMLNode* value = ConvertById(*item);
    hash = YAMLNode::Combine(hash, value->GetHash());
    hash = YAMLNode::Combine(hash, static_cast<uint32_t>(item - begin));
    sequence->Append(value);
  }
  sequence->SetHash(hash);
  return sequence.release();
}

}  // namespace vexel_yaml
