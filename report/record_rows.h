#pragma once

#include <map>
#include <set>
#include <unordered_map>
#include <unordered_set>

#include "report/record_patterns.h"
#include "report/report_rows.h"
#include "report/side_walk.h"
#include "report/version_names.h"

namespace vexel_yaml {

/// Puts the records of a merge into the rows that the walks over its versions have made: what is in conflict,
/// what was settled, and what waits for a conflict elsewhere.
class RecordRows {
 public:
  /// `places` is where the walks over the sides have shown the operations.
  RecordRows(const MergedFiles& files, VersionNames& names, const SideWords& sides,
             const SideWalk::Places& places, ReportRows& rows);

  void AddAll();

  /// Whether nothing is decided about a row as long as a record is pending. Notes which one, where that is no
  /// place around it.
  bool IsWaiting(ReportRow& row);

  /// Whether something in this place is pending.
  bool IsAroundPending(const FieldPath& path) const { return around_pending_.contains(path); }

 private:
  using Record = RecordingConflictResolver::Record;

  void AddRecord(const Record& record);
  const FieldPath* KnownPlace(const Record& record) const;
  FieldPath PlaceOfPart(FieldPath path) const;
  FieldPath PlaceOfWhole(FieldPath path);
  void ShowElement(const Record& record, ReportRow& row);
  bool IsInResult(const FieldPath& path, const ReportCell& cell) const;
  std::string OverriddenBy(const FieldPath& place) const;
  void NoteWhatWaits(const Record& record, FieldPath place);
  const YAMLScalar* FindHolder(const YAMLScalar* file_id) const;
  bool IsAboutObjects(const Operation& operation) const;
  void AddOperation(const Operation* operation, ReportRow& row, ReportCell ReportRow::*column);

  const MergedFiles& files_;
  VersionNames& names_;
  const SideWords& sides_;
  const SideWalk::Places& places_;
  ReportRows& rows_;
  RecordPatterns patterns_;
  std::set<FieldPath> around_pending_;
  // Objects, and the thing whose conflict decides about each.
  std::unordered_map<const YAMLScalar*, const YAMLScalar*> waiting_;
  // The things that are pending as a whole: what hangs below goes with them.
  std::unordered_set<const YAMLScalar*> pending_things_;
  // How many records there are about parts of each reference.
  std::map<FieldPath, size_t> reference_records_;
};

}  // namespace vexel_yaml
