#include "report/conflict_list.h"

#include "report/record_patterns.h"
#include "report/report_model.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

using Record = RecordingConflictResolver::Record;

std::string SideText(const Record& record, const Operation* operation, bool is_left) {
  const std::string_view dependency = DependencyText(record);
  if (!dependency.empty()) return IsLeftType(record.type) == is_left ? std::string(dependency) : "-";
  if (record.type == ConflictType::kTransformCycle) return "parents in a circle, broken here";
  return operation == nullptr ? "-" : OperationText(*operation);
}

}  // namespace

std::vector<ListedConflict> ListConflicts(const RecordingConflictResolver& resolver) {
  const RecordPatterns patterns(resolver);
  std::vector<ListedConflict> conflicts;
  for (const Record& record : resolver.GetRecords()) {
    if (record.resolution != MergeResolve::kConflict) continue;
    conflicts.push_back(
        {patterns.For(record), SideText(record, record.left, true), SideText(record, record.right, false)});
  }
  return conflicts;
}

}  // namespace vexel_yaml
