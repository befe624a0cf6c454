#include <algorithm>

#include "diff/yaml_diff_output.h"
#include "merge/conflict_record_file.h"

namespace vexel_yaml {

namespace {

using Record = RecordingConflictResolver::Record;

// Ends the line if one is open: the text of an operation ends its own.
void EndLine(YAMLDiffOutput& out) {
  if (out.GetColumn() != 0) out << endl;
}

// No line behind the first may begin like one of the file's own: a value may hold the text of a header.
void OutputOperation(YAMLDiffOutput& out, const Operation* operation) {
  if (operation != nullptr) {
    const bool aligns_its_lines = operation->GetKind() != Operation::Kind::kChange;
    if (!aligns_its_lines) out.PushLevel();
    operation->Output(out);
    if (!aligns_its_lines) out.PopLevel();
  }
  EndLine(out);
}

void OutputPending(YAMLDiffOutput& out, const Record& record) {
  const std::string path = PathToString(record.path);
  if (record.type == ConflictType::kTransformCycle) {
    out << "BreakCycle  " << path << " " << endl;
    return;
  }
  out << "Left  " << path << " ";
  OutputOperation(out, record.left);
  out << "Right " << path << " ";
  OutputOperation(out, record.right);
}

void OutputSettled(YAMLDiffOutput& out, const Record& record) {
  out << ConflictTypeText(record.type) << " " << PathToString(record.path) << " ";
  if (record.type >= ConflictType::kLeftAdds && record.type <= ConflictType::kRightRemoves) {
    OutputOperation(out, IsLeftType(record.type) ? record.left : record.right);
  } else {
    out << "content" << endl;
  }
}

std::string_view HandlingWord(MergeResolve resolution) {
  switch (resolution) {
    case MergeResolve::kBase:
      return "Base";
    case MergeResolve::kLeft:
      return "Left";
    case MergeResolve::kRight:
      return "Right";
    case MergeResolve::kBreakCycle:
      return "BreakCycle";
    case MergeResolve::kAutomatic:
    case MergeResolve::kConflict:
    case MergeResolve::kBlank:
      break;
  }
  return "";
}

}  // namespace

void OutputConflictRecords(std::ostream& stream, const RecordingConflictResolver& resolver, bool describe) {
  YAMLDiffOutput out(stream, 2);
  // Records are looked at in order, not copied. Stable: those of one path stay in the order of the merge.
  std::vector<const Record*> sorted;
  for (const Record& record : resolver.GetRecords()) sorted.push_back(&record);
  std::stable_sort(sorted.begin(), sorted.end(), [](const Record* a, const Record* b) {
    return RecordingConflictResolverRecordComparer(*a, *b);
  });

  out << "Conflicts:" << endl;
  for (const Record* record : sorted) {
    if (record->resolution == MergeResolve::kConflict) OutputPending(out, *record);
  }
  out << "Conflict handling:" << endl;
  for (const RecordingConflictResolver::RecordResolve& resolve : resolver.GetResolutions()) {
    out << HandlingWord(resolve.resolution) << " " << PathToString(resolve.pattern) << endl;
  }
  if (!describe) return;
  out << "Non-conflicts:" << endl;
  for (const Record* record : sorted) {
    if (record->resolution == MergeResolve::kConflict || record->type == ConflictType::kBothChange) continue;
    OutputSettled(out, *record);
  }
}

}  // namespace vexel_yaml
