#pragma once

#include "merge/conflict_resolver.h"

namespace vexel_yaml {

/// Takes one fixed side wherever both edited; one-sided edits pass.
class SidePickingConflictResolver final : public ConflictResolver {
 public:
  /// Throws YAMLError "SidePickingConflictResolver only accepts side left or right".
  explicit SidePickingConflictResolver(MergeResolve side);

  const Operation* OnSameValueAdded(const AddOperation* left, const AddOperation* right) override;
  const Operation* OnSameValueChanged(const ChangeOperation* left, const ChangeOperation* right) override;
  const Operation* OnSameValueChanged(const RemoveOperation* left, const ChangeOperation* right) override;
  const Operation* OnSameValueChanged(const RemoveOperation* left,
                                      const ChangeMappingOperation* right) override;
  const Operation* OnSameMappingChanged(const ChangeMappingOperation* left,
                                        const ChangeMappingOperation* right) override;
  const Operation* OnSameSequenceChanged(const ChangeSequenceOperation* left,
                                         const ChangeSequenceOperation* right) override;
  /// Throws YAMLError "OnComponentDependencyConflict not implemented in SidePickingConflictResolver".
  bool OnComponentDependencyConflict(const ComponentDependencyConflict& conflict) override;

 private:
  const Operation* Pick(const Operation* left, const Operation* right) const {
    return side_ == MergeResolve::kLeft ? left : right;
  }

  MergeResolve side_;
};

}  // namespace vexel_yaml
