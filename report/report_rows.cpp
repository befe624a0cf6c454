#include "report/report_rows.h"

namespace vexel_yaml {

ReportCell ChangedInside() { return {ReportCell::Kind::kEdited, std::string(kChangedInside), {}}; }

ReportObject& ReportRows::ObjectAt(const YAMLScalar* file_id) { return objects_[IndexOf(file_id)]; }

ReportRow& ReportRows::RowAt(const FieldPath& path) {
  const size_t object = IndexOf(path.front());
  std::vector<ReportRow>& rows = objects_[object].rows;
  const auto [entry, is_new] = row_places_.try_emplace(path, Place{object, rows.size()});
  if (is_new) rows.emplace_back().path = path;
  return rows[entry->second.row];
}

ReportRow* ReportRows::Find(const FieldPath& path) {
  const auto found = row_places_.find(path);
  return found == row_places_.end() ? nullptr : &objects_[found->second.object].rows[found->second.row];
}

void ReportRows::MarkAbove(const ReportRow& row) {
  for (FieldPath path = row.path; path.size() > 1;) {
    path.pop_back();
    ReportRow* const whole = Find(path);
    if (whole == nullptr) continue;
    for (const auto cell : {&ReportRow::left, &ReportRow::right, &ReportRow::result, &ReportRow::committed}) {
      if ((row.*cell).kind == ReportCell::Kind::kUnchanged) continue;
      if ((whole->*cell).kind == ReportCell::Kind::kUnchanged) whole->*cell = ChangedInside();
      (whole->*cell).parts_changed = true;
    }
  }
}

bool ReportRows::IsInConflict(FieldPath path) {
  while (path.size() > 1) {
    path.pop_back();
    const ReportRow* const whole = Find(path);
    if (whole != nullptr && whole->pending) return true;
  }
  return false;
}

size_t ReportRows::IndexOf(const YAMLScalar* file_id) {
  const auto [entry, is_new] = object_places_.try_emplace(file_id, objects_.size());
  if (is_new) {
    ReportObject& object = objects_.emplace_back();
    object.file_id = file_id;
    object.class_name = names_.GetClass(file_id);
    object.path = names_.GetPath(file_id);
  }
  return entry->second;
}

}  // namespace vexel_yaml
