#pragma once

#include <string_view>

namespace vexel_yaml {

/// How a place is resolved. The numbers are fixed: the command line uses them.
enum class MergeResolve {
  kBase = 1,
  kLeft = 2,       // "theirs"
  kRight = 3,      // "mine"
  kAutomatic = 4,  // settled without a conflict
  kConflict = 5,   // not resolved; the default side was applied provisionally
  kBlank = 6,      // a conflicting nested change is replaced by an emptied copy
  kBreakCycle = 7,
};

/// What the two sides did. From 4 to 9 even values are left-side types, odd ones right-side types.
enum class ConflictType {
  kNone = 0,
  kBothAdd = 1,
  kBothChange = 2,
  kBothRemove = 3,
  kLeftAdds = 4,
  kRightAdds = 5,
  kLeftChanges = 6,
  kRightChanges = 7,
  kLeftRemoves = 8,
  kRightRemoves = 9,
  kTransformCycle = 10,
  /// Removed on the left, changed on the right. Record files have never had a text for it.
  kLeftRemovesRightChanges = 11,
};

/// The text for record files, "<unknown conflict type>" for a type without one.
std::string_view ConflictTypeText(ConflictType type);

/// Whether a type from 4 to 9 speaks of the left side.
constexpr bool IsLeftType(ConflictType type) { return static_cast<int>(type) % 2 == 0; }

}  // namespace vexel_yaml
