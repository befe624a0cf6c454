#pragma once

#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"

namespace vexel_yaml {

/// Double dispatch over diff trees. Every default does nothing; a visitor overrides what it needs and
/// recurses itself.
class MergeTreeVisitor {
 public:
  virtual ~MergeTreeVisitor() = default;

  virtual void Visit(const RemoveOperation*) {}
  virtual void Visit(const ChangeOperation*) {}
  virtual void Visit(const AddOperation*) {}
  virtual void Visit(const ChangeMappingOperation*) {}
  virtual void Visit(const ChangeSequenceOperation*) {}
  virtual void Visit(const YAMLMappingDiff*) {}
  virtual void Visit(const YAMLSequenceDiff*) {}

  virtual void Visit(RemoveOperation*) {}
  virtual void Visit(ChangeOperation*) {}
  virtual void Visit(AddOperation*) {}
  virtual void Visit(ChangeMappingOperation*) {}
  virtual void Visit(ChangeSequenceOperation*) {}
  virtual void Visit(YAMLMappingDiff*) {}
  virtual void Visit(YAMLSequenceDiff*) {}
};

/// Copies diff trees, values included.
class MergeTreeCloneVisitor final : public MergeTreeVisitor {
 public:
  using MergeTreeVisitor::Visit;

  /// A deep copy of the operation and everything below it, from the pools.
  static Operation* Clone(const Operation* operation);

  void Visit(const RemoveOperation* operation) override;
  void Visit(const ChangeOperation* operation) override;
  void Visit(const AddOperation* operation) override;
  void Visit(const ChangeMappingOperation* operation) override;
  void Visit(const ChangeSequenceOperation* operation) override;
  void Visit(const YAMLMappingDiff* diff) override;
  void Visit(const YAMLSequenceDiff* diff) override;

 private:
  Operation* operation_ = nullptr;
  YAMLMappingDiff* mapping_diff_ = nullptr;
  YAMLSequenceDiff* sequence_diff_ = nullptr;
};

/// Empties every scalar value below a node, those of pseudo keys too: a text merge tool is to see that both
/// sides have another header. Keys stay.
class YAMLNodeClearVisitor final : public YAMLNodeVisitor {
 public:
  void Visit(const YAMLScalar& scalar) override;
  void Visit(YAMLMapping& mapping) override;
  void Visit(YAMLSequence& sequence) override;
};

/// Empties the values of a diff tree in place, which must be a clone. Key orders stay.
class MergeTreeClearVisitor final : public MergeTreeVisitor {
 public:
  using MergeTreeVisitor::Visit;

  void Visit(ChangeOperation* operation) override;
  void Visit(AddOperation* operation) override;
  void Visit(ChangeMappingOperation* operation) override;
  void Visit(ChangeSequenceOperation* operation) override;
  void Visit(YAMLMappingDiff* diff) override;
  void Visit(YAMLSequenceDiff* diff) override;

 private:
  void ClearValue(ValuedOperation* operation);
  void ClearOperation(const Operation* operation);

  YAMLNodeClearVisitor node_visitor_;
};

}  // namespace vexel_yaml
