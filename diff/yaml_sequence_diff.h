#pragma once

#include <map>
#include <set>
#include <span>

#include "diff/operation.h"

namespace vexel_yaml {

/// What happened to the elements of one sequence, by index: that of the "to" sequence, once the owning
/// operation's remapper has rearranged the "from" sequence.
class YAMLSequenceDiff {
 public:
  YAMLSequenceDiff() = default;
  YAMLSequenceDiff(const YAMLSequenceDiff&) = delete;
  YAMLSequenceDiff& operator=(const YAMLSequenceDiff&) = delete;
  virtual ~YAMLSequenceDiff() = default;
  virtual void Accept(MergeTreeVisitor& visitor) const;
  virtual void Accept(MergeTreeVisitor& visitor);

  /// Compares two lists at `path` index by index; never null. Throws what CreateDiffOperation throws.
  static YAMLSequenceDiff* Diff(FieldPath& path, std::span<YAMLNode* const> from,
                                std::span<YAMLNode* const> to);

  /// Merges two diffs index by index; never null. The indices whose operations merged to none are inserted
  /// into `dropped`.
  static YAMLSequenceDiff* Merge(const YAMLSequenceDiff& left, const YAMLSequenceDiff& right,
                                 std::set<int>& dropped, ConflictResolver& resolver);

  /// Throws YAMLError "Cannot do a double change on the same key in a sequence".
  void Add(int index, const Operation* operation);

  /// Throws YAMLError "Cannot replace non-existing key in a sequence". The operation may be null: nothing is
  /// done there any more.
  void Replace(int index, const Operation* operation);

  /// Drops the operations at the removed indices and moves the later ones down.
  void RemoveAndShiftMany(const std::set<int>& removed);

  /// The operation at `index`, null where there is none.
  const Operation* Get(int index) const;

  /// Inserts every index.
  void GetKeys(std::set<int>& keys) const;

  const std::map<int, const Operation*>& GetEntries() const { return entries_; }

  /// Performs the operations in ascending order of their indices; moves nothing.
  void Apply(YAMLSequence& sequence) const;

  /// A new diff with every operation (shared) at the index that the remapper maps its index to; of two at
  /// one index the later stays, dropped ones are left out.
  YAMLSequenceDiff* Remap(const YAMLSequenceRemapper& remapper) const;

  void Output(YAMLDiffOutput& out) const;

  /// Empties the diff, for the pool. The operations are not given back: other diffs may share them.
  void ResetForAlloc() { entries_.clear(); }

 private:
  std::map<int, const Operation*> entries_;
};

}  // namespace vexel_yaml
