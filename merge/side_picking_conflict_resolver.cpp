#include "merge/side_picking_conflict_resolver.h"

#include "yaml/yaml_error.h"

namespace vexel_yaml {

SidePickingConflictResolver::SidePickingConflictResolver(MergeResolve side) : side_(side) {
  if (side != MergeResolve::kLeft && side != MergeResolve::kRight) {
    throw YAMLError("SidePickingConflictResolver only accepts side left or right");
  }
}

const Operation* SidePickingConflictResolver::OnSameValueAdded(const AddOperation* left,
                                                               const AddOperation* right) {
  return Pick(left, right);
}

const Operation* SidePickingConflictResolver::OnSameValueChanged(const ChangeOperation* left,
                                                                 const ChangeOperation* right) {
  return Pick(left, right);
}

const Operation* SidePickingConflictResolver::OnSameValueChanged(const RemoveOperation* left,
                                                                 const ChangeOperation* right) {
  return Pick(left, right);
}

const Operation* SidePickingConflictResolver::OnSameValueChanged(const RemoveOperation* left,
                                                                 const ChangeMappingOperation* right) {
  return Pick(left, right);
}

const Operation* SidePickingConflictResolver::OnSameMappingChanged(const ChangeMappingOperation* left,
                                                                   const ChangeMappingOperation* right) {
  return Pick(left, right);
}

const Operation* SidePickingConflictResolver::OnSameSequenceChanged(const ChangeSequenceOperation* left,
                                                                    const ChangeSequenceOperation* right) {
  return Pick(left, right);
}

bool SidePickingConflictResolver::OnComponentDependencyConflict(
    const ComponentDependencyConflict& /*conflict*/) {
  throw YAMLError("OnComponentDependencyConflict not implemented in SidePickingConflictResolver");
}

}  // namespace vexel_yaml
