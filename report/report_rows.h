#pragma once

#include <map>
#include <unordered_map>
#include <vector>

#include "report/object_names.h"
#include "report/report_model.h"

namespace vexel_yaml {

/// The objects of a report and their rows, made as they are asked for. A reference is good until the next
/// object or row is made.
class ReportRows {
 public:
  /// Gives the objects their names.
  explicit ReportRows(ObjectNames& names) : names_(names) {}

  ReportObject& ObjectAt(const YAMLScalar* file_id);
  ReportRow& RowAt(const FieldPath& path);

  /// Null where there is none.
  ReportRow* Find(const FieldPath& path);

  std::vector<ReportObject>& Objects() { return objects_; }

  /// Marks as edited inside, in every place around the row's, what its cells say was done there.
  void MarkAbove(const ReportRow& row);

  /// Whether a place around `path` is in conflict.
  bool IsInConflict(FieldPath path);

 private:
  struct Place {
    size_t object;
    size_t row;
  };

  size_t IndexOf(const YAMLScalar* file_id);

  ObjectNames& names_;
  std::vector<ReportObject> objects_;
  std::unordered_map<const YAMLScalar*, size_t> object_places_;
  std::map<FieldPath, Place> row_places_;
};

/// What a cell says of a place of which parts changed that have rows of their own.
ReportCell ChangedInside();

}  // namespace vexel_yaml
