#pragma once

#include "scene/settle_values.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

/// One mapping in three versions.
struct ThreeMappings {
  YAMLMapping& base;
  YAMLMapping& left;
  YAMLMapping& right;
};

/// One place in three versions; null where nothing stands.
struct ThreeValues {
  const YAMLNode* base;
  const YAMLNode* left;
  const YAMLNode* right;

  /// `side`: base, left or right.
  const YAMLNode* Get(MergeResolve side) const {
    return side == MergeResolve::kLeft ? left : side == MergeResolve::kRight ? right : base;
  }
};

using OwnedNode = OwnedNodePtr<YAMLNode>;

/// A copy, null for null.
inline OwnedNode CopyOf(const YAMLNode* node) { return OwnedNode(node == nullptr ? nullptr : node->Clone()); }

/// Settles the values at and below a path, which begins as the resolver's.
class ValueSettler {
 public:
  ValueSettler(const HandsOff& hands_off, RecordingConflictResolver& resolver)
      : hands_off_(hands_off), resolver_(resolver), path_(resolver.GetPath()) {}

  /// Settles each entry, and the order of the keys.
  void SettleEntries(const ThreeMappings& versions);

  /// Merges two values that both sides added. Not null.
  OwnedNode MergeAdditions(const YAMLNode& left, const YAMLNode& right);

  /// Merges an element, which all versions have, completely: what the settled versions still differ in is
  /// merged as the engine does. It stands at `index`, one component below the path.
  OwnedNode MergeElement(const ThreeValues& element, const YAMLScalar* index);

  /// Records a conflict at the path; returns the side that is to stand there: base, left or right.
  MergeResolve Decide(ConflictType type, const ThreeValues& values);

  /// How many conflicts were found up to now, settled ones included.
  size_t CountConflicts() const { return resolver_.GetRecords().size(); }

  /// Whether two nodes at the path differ by no edit.
  bool AreSame(const YAMLNode* a, const YAMLNode* b);

  FieldPath& GetPath() { return path_; }

 private:
  void SettleEntry(const ThreeMappings& versions, const YAMLScalar* key);
  void SettleValue(const ThreeMappings& versions, const YAMLScalar* key, const ThreeValues& values);
  void SettleOneSided(const ThreeMappings& versions, const YAMLScalar* key, const ThreeValues& values,
                      bool left_edits);
  void SettleUnmatchable(const ThreeMappings& versions, const YAMLScalar* key, ConflictType type);
  bool AreMergedByField(const ThreeValues& values);
  bool IsEnginesConflict(const ThreeValues& values);
  OwnedNode MergeLists(const ThreeValues& lists);
  OwnedNode MergeAddedMappings(const YAMLMapping& left, const YAMLMapping& right);

  const HandsOff& hands_off_;
  RecordingConflictResolver& resolver_;
  FieldPath path_;
};

/// Merges a list that both sides changed, at the settler's path.
OwnedNode MergeLists(const YAMLSequence& base, const YAMLSequence& left, const YAMLSequence& right,
                     ValueSettler& settler);

}  // namespace vexel_yaml
