#include "merge/conflict_type.h"

namespace vexel_yaml {

std::string_view ConflictTypeText(ConflictType type) {
  switch (type) {
    case ConflictType::kNone:
      return "none";
    case ConflictType::kBothAdd:
      return "Both adds";
    case ConflictType::kBothChange:
      return "Both changes";
    case ConflictType::kBothRemove:
      return "Both removes";
    case ConflictType::kLeftAdds:
      return "Left adds";
    case ConflictType::kRightAdds:
      return "Right adds";
    case ConflictType::kLeftChanges:
      return "Left changes";
    case ConflictType::kRightChanges:
      return "Right changes";
    case ConflictType::kLeftRemoves:
      return "Left removes";
    case ConflictType::kRightRemoves:
      return "Right removes";
    case ConflictType::kTransformCycle:
      return "Transform cycle";
    case ConflictType::kLeftRemovesRightChanges:
      break;
  }
  return "<unknown conflict type>";
}

}  // namespace vexel_yaml
