#pragma once

#include <cstddef>
#include <vector>

#include "yaml/yaml_node.h"

namespace vexel_yaml {

/// An ordered list of nodes, which it owns. An element may be null: an empty slot.
class YAMLSequence final : public YAMLNode {
 public:
  /// `flow`: written in brackets.
  explicit YAMLSequence(bool flow) : YAMLNode(Kind::kSequence), flow_(flow) {}
  ~YAMLSequence() override;

  bool IsFlow() const { return flow_; }

  /// Adds at the end; the sequence then owns `node`, which may be null.
  void Append(YAMLNode* node) { items_.push_back(node); }
  void Reserve(size_t count) { items_.reserve(count); }

  /// Throws "Cannot get non existing index in YAMLSequence".
  YAMLNode* Get(int index) const;

  /// Replaces an element and returns the old one, now the caller's.
  /// Throws "Cannot change non existing index in YAMLSequence".
  YAMLNode* Set(int index, YAMLNode* node);

  /// Puts `node` into the slot at `index`, after appending as many empty slots as that takes; frees what the
  /// slot held.
  void Place(int index, YAMLNode* node);

  size_t Size() const { return items_.size(); }
  const std::vector<YAMLNode*>& GetItems() const { return items_; }

  /// Replaces the elements; returns the old ones, now the caller's.
  std::vector<YAMLNode*> SwapItems(std::vector<YAMLNode*> items);

  YAMLSequence* StaticClone() const;

  void Free() override;
  YAMLSequence* Clone() const override { return StaticClone(); }
  bool Equals(const YAMLNode* other) const override;
  bool EqualsExpensive(const YAMLNode* other) const override;
  int PopulateDocument(yaml_document_s* document) const override;
  void Accept(YAMLNodeVisitor& visitor) override { visitor.Visit(*this); }
  void ResetForAlloc() override;
  void RebuildHash(bool shallow) override;

 private:
  std::vector<YAMLNode*> items_;
  bool flow_;
};

inline const YAMLSequence* YAMLNode::AsSequence() const {
  return kind_ == Kind::kSequence ? static_cast<const YAMLSequence*>(this) : nullptr;
}
inline YAMLSequence* YAMLNode::AsSequence() {
  return kind_ == Kind::kSequence ? static_cast<YAMLSequence*>(this) : nullptr;
}

}  // namespace vexel_yaml
