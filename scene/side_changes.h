#pragma once

#include <cstdint>
#include <unordered_map>
#include <vector>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// One of the two that edited: theirs and ours.
enum class SceneSide : uint8_t { kLeft, kRight };

constexpr SceneSide OtherSide(SceneSide side) {
  return side == SceneSide::kLeft ? SceneSide::kRight : SceneSide::kLeft;
}

/// The objects in which one side differs from base, without a look at what belongs together.
struct SideChanges {
  enum class Kind : uint8_t { kRemoved, kChanged, kAdded };

  std::vector<const YAMLScalar*> removed;  ///< In base's order.
  std::vector<const YAMLScalar*> changed;  ///< In base's order.
  std::vector<const YAMLScalar*> added;    ///< In the side's order.
  std::unordered_map<const YAMLScalar*, Kind> kinds;

  bool Removed(const YAMLScalar* file_id) const { return Is(file_id, Kind::kRemoved); }
  bool Added(const YAMLScalar* file_id) const { return Is(file_id, Kind::kAdded); }
  bool Changed(const YAMLScalar* file_id) const { return Is(file_id, Kind::kChanged); }
  bool IsEmpty() const { return kinds.empty(); }
  /// Whether the side has the object as base has it, or lacks it as base does.
  bool LeftAlone(const YAMLScalar* file_id) const { return !kinds.contains(file_id); }

 private:
  bool Is(const YAMLScalar* file_id, Kind kind) const {
    const auto found = kinds.find(file_id);
    return found != kinds.end() && found->second == kind;
  }
};

/// Objects whose fields only stand in another order count as changed. To be called before any object of the
/// two versions is read: whether one of two is tells nothing then.
SideChanges FindChanges(const VexelObjects& base, const VexelObjects& side);

/// Whether one side edited the object itself: what follows from other objects (its children, its components,
/// its place among its siblings) and where it hangs don't count. Either may be null.
bool IsEdited(const YAMLScalar* file_id, const YAMLNode* base, const YAMLNode* side);

}  // namespace vexel_yaml
