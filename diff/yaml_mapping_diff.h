#pragma once

#include <cstdint>
#include <unordered_map>
#include <vector>

#include "diff/operation.h"

namespace vexel_yaml {

/// What happened to the entries of one mapping, and to the order of its keys.
class YAMLMappingDiff {
 public:
  struct Key {
    int index;
    const YAMLScalar* key;
  };

  struct Entry {
    const YAMLScalar* key;
    /// How many entries were added to this diff before it: the key's place in the output.
    uint32_t index;
    const Operation* operation;
  };

  YAMLMappingDiff() = default;
  YAMLMappingDiff(const YAMLMappingDiff&) = delete;
  YAMLMappingDiff& operator=(const YAMLMappingDiff&) = delete;
  virtual ~YAMLMappingDiff() = default;
  virtual void Accept(MergeTreeVisitor& visitor) const;
  virtual void Accept(MergeTreeVisitor& visitor);

  /// The diff that turns `from` into `to`, both at `path` (empty for whole files); never null, and it always
  /// has a key order. Throws what CreateDiffOperation throws.
  static YAMLMappingDiff* Diff(FieldPath& path, const YAMLMapping& from, const YAMLMapping& to);
  static YAMLMappingDiff* Diff(const YAMLMapping& from, const YAMLMapping& to);

  /// Merges two diffs made against one base; never null. The result shares leaf operations with both.
  static YAMLMappingDiff* Merge(const YAMLMappingDiff& left, const YAMLMappingDiff& right,
                                ConflictResolver& resolver);

  /// Throws YAMLError "Cannot do a double change on the same key in a mapping"; even then an index is used
  /// up.
  void Add(const YAMLScalar* key, const Operation* operation);

  bool HasKey(const YAMLScalar* key) const { return positions_.contains(key); }

  /// The operation at `key`, null where there is none.
  const Operation* Get(const YAMLScalar* key) const;

  /// Appends the keys that `keys` does not hold yet, in the order in which they were added to this diff.
  void GetKeys(std::vector<Key>& keys) const;

  /// In the order in which they were added.
  const std::vector<Entry>& GetEntries() const { return entries_; }

  /// Makes `mapping` what this diff says, key order included. Keys that a resolution has kept although the
  /// key order lacks them stay behind the key that precedes them in `mapping`; added ones go last.
  void Apply(YAMLMapping& mapping) const;

  void Output(YAMLDiffOutput& out) const;

  /// How the order (and the set) of the keys changed; null only in diffs that no file was compared for.
  const ChangeSequenceOperation* GetKeyOrder() const { return key_order_; }
  void SetKeyOrder(const ChangeSequenceOperation* key_order) { key_order_ = key_order; }

  /// Empties the diff, for the pool. The operations are not given back: other diffs may share them.
  void ResetForAlloc();

 private:
  friend class MergeTreeCloneVisitor;

  uint32_t next_index_ = 0;
  std::vector<Entry> entries_;
  std::unordered_map<const YAMLScalar*, size_t> positions_;
  const ChangeSequenceOperation* key_order_ = nullptr;
};

/// Orders keys as they were added to their diffs.
inline bool KeyIndexCompareLessThan(const YAMLMappingDiff::Key& a, const YAMLMappingDiff::Key& b) {
  return a.index < b.index;
}

}  // namespace vexel_yaml
