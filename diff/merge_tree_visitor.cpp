#include "diff/merge_tree_visitor.h"

namespace vexel_yaml {

void RemoveOperation::Accept(MergeTreeVisitor& visitor) const { visitor.Visit(this); }
void RemoveOperation::Accept(MergeTreeVisitor& visitor) { visitor.Visit(this); }
void ChangeOperation::Accept(MergeTreeVisitor& visitor) const { visitor.Visit(this); }
void ChangeOperation::Accept(MergeTreeVisitor& visitor) { visitor.Visit(this); }
void AddOperation::Accept(MergeTreeVisitor& visitor) const { visitor.Visit(this); }
void AddOperation::Accept(MergeTreeVisitor& visitor) { visitor.Visit(this); }
void ChangeMappingOperation::Accept(MergeTreeVisitor& visitor) const { visitor.Visit(this); }
void ChangeMappingOperation::Accept(MergeTreeVisitor& visitor) { visitor.Visit(this); }
void ChangeSequenceOperation::Accept(MergeTreeVisitor& visitor) const { visitor.Visit(this); }
void ChangeSequenceOperation::Accept(MergeTreeVisitor& visitor) { visitor.Visit(this); }
void YAMLMappingDiff::Accept(MergeTreeVisitor& visitor) const { visitor.Visit(this); }
void YAMLMappingDiff::Accept(MergeTreeVisitor& visitor) { visitor.Visit(this); }
void YAMLSequenceDiff::Accept(MergeTreeVisitor& visitor) const { visitor.Visit(this); }
void YAMLSequenceDiff::Accept(MergeTreeVisitor& visitor) { visitor.Visit(this); }

}  // namespace vexel_yaml
