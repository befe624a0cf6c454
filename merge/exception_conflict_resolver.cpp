#include "merge/exception_conflict_resolver.h"

#include "yaml/yaml_error.h"

namespace vexel_yaml {

const Operation* ExceptionConflictResolver::OnSameValueAdded(const AddOperation* left,
                                                             const AddOperation* /*right*/) {
  throw YAMLError("Conflict for same value added " + PathToString(GetPath()) + " at line " +
                  std::to_string(left->GetValue()->GetLine()));
}

const Operation* ExceptionConflictResolver::OnSameValueChanged(const ChangeOperation* /*left*/,
                                                               const ChangeOperation* /*right*/) {
  throw YAMLError("Conflict for same value changed " + PathToString(GetPath()));
}

const Operation* ExceptionConflictResolver::OnSameValueChanged(const RemoveOperation* /*left*/,
                                                               const ChangeOperation* /*right*/) {
  throw YAMLError("Conflict for removed value changed " + PathToString(GetPath()));
}

const Operation* ExceptionConflictResolver::OnSameValueChanged(const RemoveOperation* /*left*/,
                                                               const ChangeMappingOperation* /*right*/) {
  throw YAMLError("Conflict for removed value changed " + PathToString(GetPath()));
}

const Operation* ExceptionConflictResolver::OnSameMappingChanged(const ChangeMappingOperation* /*left*/,
                                                                 const ChangeMappingOperation* /*right*/) {
  throw YAMLError("Conflict for same mapping changed " + PathToString(GetPath()));
}

const Operation* ExceptionConflictResolver::OnSameSequenceChanged(const ChangeSequenceOperation* /*left*/,
                                                                  const ChangeSequenceOperation* /*right*/) {
  throw YAMLError("Conflict for same sequence changed " + PathToString(GetPath()));
}

bool ExceptionConflictResolver::OnComponentDependencyConflict(
    const ComponentDependencyConflict& /*conflict*/) {
  throw YAMLError("OnComponentDependencyConflict not implemented in ExceptionConflictResolver");
}

}  // namespace vexel_yaml
