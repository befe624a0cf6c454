#pragma once

#include "merge/conflict_resolver.h"

namespace vexel_yaml {

/// For callers that take no conflict: throws a YAMLError that names the path wherever both sides edited.
class ExceptionConflictResolver final : public ConflictResolver {
 public:
  const Operation* OnSameValueAdded(const AddOperation* left, const AddOperation* right) override;
  const Operation* OnSameValueChanged(const ChangeOperation* left, const ChangeOperation* right) override;
  const Operation* OnSameValueChanged(const RemoveOperation* left, const ChangeOperation* right) override;
  const Operation* OnSameValueChanged(const RemoveOperation* left,
                                      const ChangeMappingOperation* right) override;
  const Operation* OnSameMappingChanged(const ChangeMappingOperation* left,
                                        const ChangeMappingOperation* right) override;
  const Operation* OnSameSequenceChanged(const ChangeSequenceOperation* left,
                                         const ChangeSequenceOperation* right) override;
  bool OnComponentDependencyConflict(const ComponentDependencyConflict& conflict) override;
};

}  // namespace vexel_yaml
