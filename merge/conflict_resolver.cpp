#include "merge/conflict_resolver.h"

#include <utility>

#include "yaml/yaml_error.h"

namespace vexel_yaml {

const Operation* ConflictResolver::OnValueAdded(const AddOperation* operation, ConflictType /*type*/) {
  return operation;
}

const Operation* ConflictResolver::OnValueChanged(const ChangeOperation* operation, ConflictType /*type*/) {
  return operation;
}

const Operation* ConflictResolver::OnValueRemoved(const RemoveOperation* operation, ConflictType /*type*/) {
  return operation;
}

const Operation* ConflictResolver::OnMappingChanged(const ChangeMappingOperation* operation,
                                                    ConflictType /*type*/) {
  return operation;
}

const Operation* ConflictResolver::OnSequenceChanged(const ChangeSequenceOperation* operation,
                                                     ConflictType /*type*/) {
  return operation;
}

void ConflictResolver::OnTransformCycleDetected(const YAMLScalar* /*object*/,
                                                const YAMLMapping* /*transform*/,
                                                const YAMLScalar* /*cycle*/) {}

const Operation* ConflictResolver::OnSameValueRemoved(const RemoveOperation* left,
                                                      const RemoveOperation* /*right*/) {
  return left;
}

void ConflictResolver::PushPath(const YAMLScalar* key) {
  if (key == YAMLScalar::mFather && !path_.empty() &&
      (path_.back() == YAMLScalar::transform || path_.back() == YAMLScalar::rectTransform)) {
    merged_transforms_.insert(path_.front());
  }
  path_.push_back(key);
}

void ConflictResolver::PopPath() {
  if (path_.empty()) throw YAMLError("Tried to pop on empty ConflictResolver path");
  path_.pop_back();
}

FieldPath ConflictResolver::ExchangePath(FieldPath path) { return std::exchange(path_, std::move(path)); }

}  // namespace vexel_yaml
