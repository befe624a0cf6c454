#pragma once

#include <cstdint>

#include "rules/yaml_sequence_remapper.h"
#include "yaml/yaml_mapping.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

class ConflictResolver;
class MergeTreeVisitor;
class YAMLDiffOutput;
class YAMLMappingDiff;
class YAMLSequenceDiff;

/// A leaf or inner step of a diff tree: what happened to one mapping entry or sequence element.
///
/// Operations come from their pools and are never changed after they are made, but for clones
/// (MergeTreeClearVisitor). They refer to nodes of the document they were made against, which must outlive
/// them; applying one inserts a copy.
class Operation {
 public:
  enum class Kind : uint8_t { kRemove, kChange, kAdd, kChangeMapping, kChangeSequence };

  Operation(const Operation&) = delete;
  Operation& operator=(const Operation&) = delete;

  /// Prints the operation, continuing the line that holds its key or index.
  virtual void Output(YAMLDiffOutput& out) const = 0;

  /// Performs the operation on the entry at `key` or the element at `index`. Throws the YAMLErrors of the
  /// node classes, and std::bad_cast where a nested change finds no node of its kind.
  virtual void Apply(YAMLMapping& mapping, const YAMLScalar* key) const = 0;
  virtual void Apply(YAMLSequence& sequence, int index) const = 0;

  virtual void Accept(MergeTreeVisitor& visitor) const = 0;
  virtual void Accept(MergeTreeVisitor& visitor) = 0;

  /// Merges what two sides did at one place; either may be null. Returns the operation that the resolver
  /// decided on, often one of the two, or null to leave the place as it is in base.
  static const Operation* Merge(const Operation* left, const Operation* right, ConflictResolver& resolver);

  Kind GetKind() const { return kind_; }

  /// Whether the change may be merged part by part with one of the other side's.
  bool IsMergeable() const { return mergeable_; }

  /// Gives back what the operation owns, for the pool: nothing, but for the changes of a mapping or sequence.
  void ResetForAlloc() {}

 protected:
  Operation(Kind kind, bool mergeable) : kind_(kind), mergeable_(mergeable) {}
  ~Operation() = default;

 private:
  Kind kind_;
  bool mergeable_;
};

class RemoveOperation final : public Operation {
 public:
  explicit RemoveOperation(bool mergeable) : Operation(Kind::kRemove, mergeable) {}
  void Output(YAMLDiffOutput& out) const override;
  void Apply(YAMLMapping& mapping, const YAMLScalar* key) const override;
  void Apply(YAMLSequence& sequence, int index) const override;
  void Accept(MergeTreeVisitor& visitor) const override;
  void Accept(MergeTreeVisitor& visitor) override;
};

/// Carries a value, which it does not own.
class ValuedOperation : public Operation {
 public:
  const YAMLNode* GetValue() const { return value_; }
  void SetValue(const YAMLNode* value) { value_ = value; }

 protected:
  ValuedOperation(Kind kind, const YAMLNode* value, bool mergeable)
      : Operation(kind, mergeable), value_(value) {}
  ~ValuedOperation() = default;

 private:
  const YAMLNode* value_;
};

/// A value became another one. Never mergeable.
class ChangeOperation final : public ValuedOperation {
 public:
  explicit ChangeOperation(const YAMLNode* value) : ValuedOperation(Kind::kChange, value, false) {}
  void Output(YAMLDiffOutput& out) const override;
  void Apply(YAMLMapping& mapping, const YAMLScalar* key) const override;
  void Apply(YAMLSequence& sequence, int index) const override;
  void Accept(MergeTreeVisitor& visitor) const override;
  void Accept(MergeTreeVisitor& visitor) override;
};

class AddOperation final : public ValuedOperation {
 public:
  AddOperation(const YAMLNode* value, bool mergeable) : ValuedOperation(Kind::kAdd, value, mergeable) {}
  void Output(YAMLDiffOutput& out) const override;
  void Apply(YAMLMapping& mapping, const YAMLScalar* key) const override;
  /// Writes into the slot at `index`; later elements stay where they are.
  void Apply(YAMLSequence& sequence, int index) const override;
  void Accept(MergeTreeVisitor& visitor) const override;
  void Accept(MergeTreeVisitor& visitor) override;
};

class ChangeMappingOperation final : public Operation {
 public:
  /// `diff` is given back to its pool together with the operation.
  ChangeMappingOperation(YAMLMappingDiff* diff, bool mergeable)
      : Operation(Kind::kChangeMapping, mergeable), diff_(diff) {}
  void ResetForAlloc();
  void Output(YAMLDiffOutput& out) const override;
  void Apply(YAMLMapping& mapping, const YAMLScalar* key) const override;
  void Apply(YAMLSequence& sequence, int index) const override;
  void Accept(MergeTreeVisitor& visitor) const override;
  void Accept(MergeTreeVisitor& visitor) override;

  /// A new operation that holds the merged diff; mergeable when both are.
  static const ChangeMappingOperation* Merge(const ChangeMappingOperation& left,
                                             const ChangeMappingOperation& right, ConflictResolver& resolver);

  const YAMLMappingDiff* GetDiff() const { return diff_; }
  YAMLMappingDiff* GetDiff() { return diff_; }

 private:
  YAMLMappingDiff* diff_;
};

class ChangeSequenceOperation final : public Operation {
 public:
  /// `diff` and `remapper` are given back to their pools together with the operation. `remapper` may be null:
  /// nothing moves.
  ChangeSequenceOperation(YAMLSequenceDiff* diff, YAMLSequenceRemapper* remapper, bool mergeable)
      : Operation(Kind::kChangeSequence, mergeable), remapper_(remapper), diff_(diff) {}
  void ResetForAlloc();
  void Output(YAMLDiffOutput& out) const override;
  void Apply(YAMLMapping& mapping, const YAMLScalar* key) const override;
  void Apply(YAMLSequence& sequence, int index) const override;
  void Accept(MergeTreeVisitor& visitor) const override;
  void Accept(MergeTreeVisitor& visitor) override;

  /// Performs the operation on `sequence` itself. Unlike the two above it passes an identity remapper over,
  /// so that the sequence keeps its length.
  void Apply(YAMLSequence& sequence) const;

  /// Aligns both sides' numbering, then merges element by element. Returns a new operation, or `left` itself
  /// where both sides made the same edit. `drop_if_removed_on_either_side`: a removed element is removed,
  /// though the other side kept it.
  static const ChangeSequenceOperation* Merge(const ChangeSequenceOperation& left,
                                              const ChangeSequenceOperation& right,
                                              ConflictResolver& resolver,
                                              bool drop_if_removed_on_either_side);

  const YAMLSequenceRemapper* GetRemapper() const { return remapper_; }
  const YAMLSequenceDiff* GetDiff() const { return diff_; }
  YAMLSequenceDiff* GetDiff() { return diff_; }

 private:
  void ApplyAlways(YAMLSequence& sequence) const;

  YAMLSequenceRemapper* remapper_;
  YAMLSequenceDiff* diff_;
};

/// Compares two nodes at `path`, which is the same again on return. Returns the operation that makes `from`
/// equal to `to`, from its pool, or null when there is nothing to record. Either node may be null: nothing
/// stands there. Throws YAMLError for mappings with duplicate keys and std::length_error for lists that
/// cannot be matched.
Operation* CreateDiffOperation(FieldPath& path, const YAMLNode* from, const YAMLNode* to);

/// Whether two operations are deeply equal: they make the same of the same base. Neither may be null.
bool OperationEquals(const Operation& a, const Operation& b);

}  // namespace vexel_yaml
