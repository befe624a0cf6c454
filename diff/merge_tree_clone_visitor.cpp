#include <utility>

#include "diff/merge_tree_visitor.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

Operation* MergeTreeCloneVisitor::Clone(const Operation* operation) {
  MergeTreeCloneVisitor visitor;
  operation->Accept(visitor);
  return visitor.operation_;
}

void MergeTreeCloneVisitor::Visit(const RemoveOperation* operation) {
  operation_ = YAMLAlloc<RemoveOperation>::create(operation->IsMergeable());
}

void MergeTreeCloneVisitor::Visit(const ChangeOperation* operation) {
  operation_ = YAMLAlloc<ChangeOperation>::create(operation->GetValue()->Clone());
}

void MergeTreeCloneVisitor::Visit(const AddOperation* operation) {
  operation_ = YAMLAlloc<AddOperation>::create(operation->GetValue()->Clone(), operation->IsMergeable());
}

void MergeTreeCloneVisitor::Visit(const ChangeMappingOperation* operation) {
  operation->GetDiff()->Accept(*this);
  operation_ = YAMLAlloc<ChangeMappingOperation>::create(std::exchange(mapping_diff_, nullptr),
                                                         operation->IsMergeable());
}

void MergeTreeCloneVisitor::Visit(const ChangeSequenceOperation* operation) {
  operation->GetDiff()->Accept(*this);
  const YAMLSequenceRemapper* remapper = operation->GetRemapper();
  operation_ = YAMLAlloc<ChangeSequenceOperation>::create(
      std::exchange(sequence_diff_, nullptr),
      remapper == nullptr ? nullptr : YAMLAlloc<YAMLSequenceRemapper>::create(*remapper),
      operation->IsMergeable());
}

void MergeTreeCloneVisitor::Visit(const YAMLMappingDiff* diff) {
  auto* clone = YAMLAlloc<YAMLMappingDiff>::create();
  clone->entries_ = diff->entries_;
  for (YAMLMappingDiff::Entry& entry : clone->entries_) entry.operation = Clone(entry.operation);
  clone->positions_ = diff->positions_;
  clone->next_index_ = diff->next_index_;
  if (diff->key_order_ != nullptr) {
    diff->key_order_->Accept(*this);
    clone->key_order_ = static_cast<ChangeSequenceOperation*>(std::exchange(operation_, nullptr));
  }
  mapping_diff_ = clone;
}

void MergeTreeCloneVisitor::Visit(const YAMLSequenceDiff* diff) {
  auto* clone = YAMLAlloc<YAMLSequenceDiff>::create();
  for (const auto& [index, operation] : diff->GetEntries()) clone->Add(index, Clone(operation));
  sequence_diff_ = clone;
}

}  // namespace vexel_yaml
