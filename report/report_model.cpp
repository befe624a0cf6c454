#include "report/report_model.h"

namespace vexel_yaml {

std::string_view DependencyText(const RecordingConflictResolver::Record& record) {
  if (record.path.size() != 1 || record.resolution != MergeResolve::kConflict) return {};
  switch (record.type) {
    case ConflictType::kLeftAdds:
    case ConflictType::kRightAdds:
      return "added a component that can't stand beside another one";
    case ConflictType::kLeftRemoves:
    case ConflictType::kRightRemoves:
      return "removed what another component needs";
    default:
      return {};
  }
}

}  // namespace vexel_yaml
