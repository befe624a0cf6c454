#pragma once

#include <set>

#include "diff/operation.h"
#include "merge/component_dependency_conflict.h"
#include "merge/conflict_type.h"

namespace vexel_yaml {

/// Decides, place by place, what the merged tree holds where one or both sides edited.
///
/// A callback returns the operation to store, or null to leave the place as it is in base. The engine keeps
/// the path of the place up to date around every callback. The defaults let one-sided edits pass.
class ConflictResolver {
 public:
  virtual ~ConflictResolver() = default;

  virtual const Operation* OnValueAdded(const AddOperation* operation, ConflictType type);
  virtual const Operation* OnValueChanged(const ChangeOperation* operation, ConflictType type);
  virtual const Operation* OnValueRemoved(const RemoveOperation* operation, ConflictType type);
  virtual const Operation* OnMappingChanged(const ChangeMappingOperation* operation, ConflictType type);
  virtual const Operation* OnSequenceChanged(const ChangeSequenceOperation* operation, ConflictType type);

  /// The parents of `transform`, the document of `object`, form a loop in the merged file; whoever calls this
  /// breaks it.
  virtual void OnTransformCycleDetected(const YAMLScalar* object, const YAMLMapping* transform,
                                        const YAMLScalar* cycle);

  virtual const Operation* OnSameValueAdded(const AddOperation* left, const AddOperation* right) = 0;
  virtual const Operation* OnSameValueChanged(const ChangeOperation* left, const ChangeOperation* right) = 0;
  virtual const Operation* OnSameValueChanged(const RemoveOperation* left, const ChangeOperation* right) = 0;
  virtual const Operation* OnSameValueChanged(const RemoveOperation* left,
                                              const ChangeMappingOperation* right) = 0;
  virtual const Operation* OnSameValueRemoved(const RemoveOperation* left, const RemoveOperation* right);
  virtual const Operation* OnSameMappingChanged(const ChangeMappingOperation* left,
                                                const ChangeMappingOperation* right) = 0;
  virtual const Operation* OnSameSequenceChanged(const ChangeSequenceOperation* left,
                                                 const ChangeSequenceOperation* right) = 0;

  /// Returns whether the conflict is pending, that is, not settled by the user.
  virtual bool OnComponentDependencyConflict(const ComponentDependencyConflict& conflict) = 0;

  /// Descends to `key`. Notes the object whose transform's parent is being merged.
  void PushPath(const YAMLScalar* key);

  /// Throws YAMLError "Tried to pop on empty ConflictResolver path".
  void PopPath();

  const FieldPath& GetPath() const { return path_; }

  /// Replaces the path and returns the old one.
  FieldPath ExchangePath(FieldPath path);

  /// File IDs of the objects whose transform both sides edited or added, one of them at least its parent.
  const std::set<const YAMLScalar*, ScalarTextLess>& GetMergedTransforms() const {
    return merged_transforms_;
  }

 private:
  FieldPath path_;
  std::set<const YAMLScalar*, ScalarTextLess> merged_transforms_;
};

/// Stands at one key below the resolver's path for its own lifetime.
class ResolverPathStep {
 public:
  ResolverPathStep(ConflictResolver& resolver, const YAMLScalar* key) : resolver_(resolver) {
    resolver_.PushPath(key);
  }
  ResolverPathStep(const ResolverPathStep&) = delete;
  ResolverPathStep& operator=(const ResolverPathStep&) = delete;
  ~ResolverPathStep() { resolver_.PopPath(); }

 private:
  ConflictResolver& resolver_;
};

}  // namespace vexel_yaml
