#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

enum class Version { kBase, kLeft, kRight };

/// What a generated scene holds and which side edits what.
///
/// A scene is a tree of groups, each the six documents of one game object. Every answer is computed from
/// the seed and a position, so a scene of any size is planned without keeping anything in memory.
/// A slot is the position of a document; it names the document in every version.
class ScenePlan {
 public:
  static constexpr uint64_t kGroupSize = 6;

  /// `edited_share` is the part of the objects that each side changes, adds or removes, at most 0.5. With a
  /// share of 1 both sides change a field of every object that has fields, and add and remove nothing.
  ScenePlan(uint64_t objects, double edited_share, uint64_t seed);

  uint64_t group_count() const { return objects_ / kGroupSize; }

  /// Documents that are left over where the number of objects is no multiple of a group.
  uint64_t loose_count() const { return objects_ % kGroupSize; }

  /// Groups that this version alone adds at the end of the file, below the scene's root.
  uint64_t TailCount(Version version) const;

  static uint64_t Slot(uint64_t group, uint64_t document) { return group * kGroupSize + document; }

  /// The slot of a document that `version` adds beside `group`; never one that another version uses.
  static uint64_t AddedSlot(Version version, uint64_t group, uint64_t document);

  /// Unlike for unlike slots; one group in eight has the 64-bit ids, some of them negative.
  static std::string FileID(uint64_t slot);

  std::optional<uint64_t> ParentOf(uint64_t group) const;
  std::vector<uint64_t> ChildrenOf(uint64_t group) const;

  /// Only groups without children are removed, and the other side leaves those alone.
  bool IsRemoved(uint64_t group, Version version) const;
  bool AddsChild(uint64_t group, Version version) const;

  /// 0 where `version` leaves the document as it is, else 1 to 4: which of its fields is edited.
  /// Where both sides edit one document, left gets 1 or 2 and right 3 or 4.
  int EditOf(uint64_t slot, Version version) const;

  /// The same number for the same seed, slot and field, in every version.
  uint64_t Random(uint64_t slot, uint64_t field) const;

  static bool HoldsPrefab(uint64_t group) { return group % 40 == 7; }
  static bool HoldsStateMachine(uint64_t group) { return group % 150 == 11; }

 private:
  double Chance(uint64_t slot, uint64_t question) const;
  bool IsRemovedByAnySide(uint64_t group) const;

  uint64_t objects_;
  double edited_share_;
  bool is_all_edited_;
  uint64_t seed_;
};
