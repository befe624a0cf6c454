#pragma once

#include <unordered_map>
#include <utility>
#include <vector>

#include "merge/conflict_resolver.h"

namespace vexel_yaml {

/// The resolver of the merge command: settles what it can by itself, applies the user's resolutions, lets the
/// default side stand in for real conflicts, and records every decision.
class RecordingConflictResolver final : public ConflictResolver {
 public:
  struct Record {
    FieldPath path;
    ConflictType type;
    MergeResolve resolution;
    /// Not owned; null where that side did nothing, and in records of one-sided removals.
    const Operation* left;
    const Operation* right;
  };

  struct RecordResolve {
    /// "*" stands for any one component. Any other matches as it stands, or with its escapes resolved, so
    /// that what PathToString wrote is a pattern for that path, if maybe not for it alone.
    FieldPath pattern;
    MergeResolve resolution;
  };

  /// `default_side`: base, left or right; blank empties what is in conflict.
  explicit RecordingConflictResolver(MergeResolve default_side) : default_side_(default_side) {}

  /// Replaces the user's resolutions; the first one that matches a place wins.
  void SetResolveMethodForPaths(std::vector<RecordResolve> resolutions);

  /// For conflicts that are found outside of the diff trees: what the user wants at `path`; automatic where
  /// nothing is said of it.
  MergeResolve FindResolution(const FieldPath& path) const;
  MergeResolve GetDefaultSide() const { return default_side_; }
  void AddRecord(Record record);

  /// Both at once. Either operation may be null. Returns what is to stand there: base, left or right, where
  /// it is pending the default side's (base's for blank).
  MergeResolve SettleConflict(FieldPath path, ConflictType type, const Operation* left,
                              const Operation* right);

  /// Whether a record is neither settled by the user nor by itself.
  bool HasPendingConflicts() const;
  const std::vector<Record>& GetRecords() const { return records_; }
  const std::vector<RecordResolve>& GetResolutions() const { return resolutions_; }

  /// The patterns that fit no record, in their own order.
  std::vector<FieldPath> FindUnmatchedPatterns() const;

  const Operation* OnValueAdded(const AddOperation* operation, ConflictType type) override;
  const Operation* OnValueChanged(const ChangeOperation* operation, ConflictType type) override;
  const Operation* OnValueRemoved(const RemoveOperation* operation, ConflictType type) override;
  const Operation* OnMappingChanged(const ChangeMappingOperation* operation, ConflictType type) override;
  const Operation* OnSequenceChanged(const ChangeSequenceOperation* operation, ConflictType type) override;
  void OnTransformCycleDetected(const YAMLScalar* object, const YAMLMapping* transform,
                                const YAMLScalar* cycle) override;
  const Operation* OnSameValueAdded(const AddOperation* left, const AddOperation* right) override;
  const Operation* OnSameValueChanged(const ChangeOperation* left, const ChangeOperation* right) override;
  const Operation* OnSameValueChanged(const RemoveOperation* left, const ChangeOperation* right) override;
  const Operation* OnSameValueChanged(const RemoveOperation* left,
                                      const ChangeMappingOperation* right) override;
  const Operation* OnSameValueRemoved(const RemoveOperation* left, const RemoveOperation* right) override;
  const Operation* OnSameMappingChanged(const ChangeMappingOperation* left,
                                        const ChangeMappingOperation* right) override;
  const Operation* OnSameSequenceChanged(const ChangeSequenceOperation* left,
                                         const ChangeSequenceOperation* right) override;
  bool OnComponentDependencyConflict(const ComponentDependencyConflict& conflict) override;

 private:
  bool Matches(size_t place, const FieldPath& path) const;
  /// The place of the first resolution that begins with `first` and matches `path`.
  size_t FindResolution(const YAMLScalar* first, const FieldPath& path) const;

  template <typename T>
  const Operation* SingleSideResolve(const T* operation, ConflictType type);

  /// Settles a two-sided place: by the user's resolution, else by `settle` (the operation that both sides'
  /// edits agree on, or null), else as a conflict. `blank_source` is emptied where the default side is blank.
  template <typename Settle>
  const Operation* TwoSidedResolve(ConflictType type, const Operation* left, const Operation* right,
                                   const Operation* blank_source, Settle settle);

  const Operation* ProvisionalResult(const Operation* left, const Operation* right,
                                     const Operation* blank_source) const;
  const Operation* MergeAdditions(const AddOperation* left, const AddOperation* right);
  Record& AddRecord(FieldPath path, ConflictType type, MergeResolve resolution, const Operation* left,
                    const Operation* right);

  MergeResolve default_side_;
  std::vector<Record> records_;
  std::vector<RecordResolve> resolutions_;
  // The patterns of resolutions_, with their escapes resolved.
  std::vector<FieldPath> resolved_patterns_;
  // The places in resolutions_ of the patterns that begin with a component, "*" being one: a user may have
  // settled thousands of conflicts one by one.
  std::unordered_map<const YAMLScalar*, std::vector<size_t>> resolutions_by_first_;
  // The first record of each path of one component.
  std::unordered_map<const YAMLScalar*, size_t> object_records_;
};

/// Record order in files: by path, component by component, byte-wise; a path before its extensions.
bool RecordingConflictResolverRecordComparer(const RecordingConflictResolver::Record& a,
                                             const RecordingConflictResolver::Record& b);

}  // namespace vexel_yaml
