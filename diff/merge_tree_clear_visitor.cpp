#include "diff/merge_tree_visitor.h"

namespace vexel_yaml {

void YAMLNodeClearVisitor::Visit(const YAMLScalar& /*scalar*/) {}

void YAMLNodeClearVisitor::Visit(YAMLMapping& mapping) {
  for (const auto& [key, value] : mapping) {
    if (value->AsScalar() != nullptr) {
      mapping.Change(key, YAMLScalar::empty->AsValue());
    } else {
      value->Accept(*this);
    }
  }
}

void YAMLNodeClearVisitor::Visit(YAMLSequence& sequence) {
  for (int i = 0; i < static_cast<int>(sequence.Size()); ++i) {
    YAMLNode* item = sequence.Get(i);
    if (item == nullptr) continue;
    if (item->AsScalar() != nullptr) {
      sequence.Set(i, YAMLScalar::empty->AsValue());
    } else {
      item->Accept(*this);
    }
  }
}

void MergeTreeClearVisitor::Visit(ChangeOperation* operation) { ClearValue(operation); }

void MergeTreeClearVisitor::Visit(AddOperation* operation) { ClearValue(operation); }

void MergeTreeClearVisitor::Visit(ChangeMappingOperation* operation) { operation->GetDiff()->Accept(*this); }

void MergeTreeClearVisitor::Visit(ChangeSequenceOperation* operation) { operation->GetDiff()->Accept(*this); }

void MergeTreeClearVisitor::Visit(YAMLMappingDiff* diff) {
  for (const YAMLMappingDiff::Entry& entry : diff->GetEntries()) ClearOperation(entry.operation);
}

void MergeTreeClearVisitor::Visit(YAMLSequenceDiff* diff) {
  for (const auto& [index, operation] : diff->GetEntries()) ClearOperation(operation);
}

void MergeTreeClearVisitor::ClearValue(ValuedOperation* operation) {
  if (operation->GetValue()->AsScalar() != nullptr) {
    operation->SetValue(YAMLScalar::empty);
  } else {
    // A clone owns its values, so they may be changed.
    const_cast<YAMLNode*>(operation->GetValue())->Accept(node_visitor_);
  }
}

void MergeTreeClearVisitor::ClearOperation(const Operation* operation) {
  const_cast<Operation*>(operation)->Accept(*this);
}

}  // namespace vexel_yaml
