#include <algorithm>
#include <map>
#include <set>

#include "report/natural_order.h"
#include "report/record_rows.h"
#include "report/report_places.h"
#include "report/report_rows.h"
#include "report/shown_diff.h"
#include "report/side_walk.h"
#include "report/version_names.h"

namespace vexel_yaml {

namespace {

using Kind = ReportCell::Kind;

constexpr std::string_view kInConflict = "in conflict";

class Collector {
 public:
  Collector(const MergedFiles& files, VersionNames& names, const SideWords& sides)
      : files_(files), names_(names), sides_(sides) {}

  std::vector<ReportObject> Collect() {
    AddSide(&ReportRow::left, &ReportObject::left, *files_.diffs.left, files_.read.left);
    AddSide(&ReportRow::right, &ReportObject::right, *files_.diffs.right, files_.read.right);
    if (files_.merged != nullptr) {
      AddResult();
      AddRepairs();
    }
    if (files_.committed != nullptr) AddCommitted();
    AddRenumbered();
    records_.AddAll();
    for (ReportObject& object : rows_.Objects()) Finish(object);
    std::ranges::stable_sort(rows_.Objects(), [](const ReportObject& a, const ReportObject& b) {
      if (a.pending != b.pending) return a.pending;
      if (a.path.empty() != b.path.empty()) return b.path.empty();
      return ComesBefore(a.path, b.path);
    });
    return std::move(rows_.Objects());
  }

 private:
  static void MarkChange(ReportObject& object, const FieldPath& path, Kind kind) {
    const bool whole = path.size() == 1;
    object.added |= whole && kind == Kind::kAdded;
    object.removed |= whole && kind == Kind::kRemoved;
    object.changed |= !whole || kind == Kind::kChanged;
  }

  void AddSide(ReportCell ReportRow::*cell, bool ReportObject::*side, const YAMLMappingDiff& diff,
               const VexelObjects& to) {
    const auto found = [&](const FieldPath& path, ReportCell change, const YAMLNode* from) {
      ReportObject& object = rows_.ObjectAt(path.front());
      object.*side = true;
      MarkChange(object, path, change.kind);
      SetCell(path, cell, std::move(change), from);
      if (path.back() == YAMLScalar::mFather) rows_.RowAt(path).note = "Moved to another parent";
    };
    SideWalk(names_.In(cell), found, GoneIn(cell), &places_).Walk(diff, files_.read.base, to);
  }

  SideWalk::Gone GoneIn(ReportCell ReportRow::*cell) {
    return [this, cell](const FieldPath& path) { gone_[path].push_back(cell); };
  }

  void AddResult() {
    const auto found = [&](const FieldPath& path, ReportCell change, const YAMLNode* from) {
      SetCell(path, &ReportRow::result, std::move(change), from);
    };
    const YAMLMapping& base = files_.read.base;
    SideWalk(names_.In(&ReportRow::result), found, GoneIn(&ReportRow::result), nullptr)
        .Walk(*DiffToShow(base, *files_.merged), base, *files_.merged);
  }

  void AddCommitted() {
    const auto found = [&](const FieldPath& path, ReportCell change, const YAMLNode* from) {
      MarkChange(rows_.ObjectAt(path.front()), path, change.kind);
      SetCell(path, &ReportRow::committed, std::move(change), from);
    };
    const auto& [base, committed, same] = static_cast<const MergeDocuments&>(*files_.committed);
    SideWalk(names_.In(&ReportRow::committed), found, GoneIn(&ReportRow::committed), nullptr)
        .Walk(*DiffToShow(base, committed), base, committed);
  }

  void AddRepairs() {
    const auto found = [&](const FieldPath& path, const ReportCell& change, const YAMLNode* from) {
      ReportRow& row = rows_.RowAt(path);
      row.repaired = true;
      if (path.size() == 1 || from == nullptr) {
        row.note = change.kind == Kind::kRemoved ? "Removed by the repairs" : "Added by the repairs";
      } else {
        row.note = "Before the repair: " +
                   ValueCell(path, from, Kind::kUnchanged, names_.In(&ReportRow::result)).ForPeople();
      }
      if (row.result.kind == Kind::kUnchanged && change.kind != Kind::kUnchanged) row.result = change;
    };
    SideWalk(
        names_.In(&ReportRow::result), found, [](const FieldPath&) {}, nullptr)
        .Walk(*DiffToShow(*files_.unrepaired, *files_.merged), *files_.unrepaired, *files_.merged);
  }

  void AddRenumbered() {
    for (const RenumberedObject& renumbered : files_.read.renumbered) {
      ReportRow& row = rows_.RowAt({renumbered.new_id});
      row.repaired = true;
      row.note = "Both sides added another object as " + renumbered.old_id->GetText() + "; " + sides_.right +
                 "'s was given a file ID of its own";
    }
  }

  void SetCell(const FieldPath& path, ReportCell ReportRow::*cell, ReportCell change, const YAMLNode* from) {
    ReportRow& row = rows_.RowAt(path);
    row.*cell = std::move(change);
    if (!row.base.text.empty() || from == nullptr) return;
    row.base = ValueCell(path, from, Kind::kUnchanged, names_.In(&ReportRow::base));
    // Of the many overrides of a prefab instance, which tell people nothing by their numbers.
    const FieldPath element(path.begin(), path.end() - 1);
    row.overridden = PropertyOf(NodeAt(&files_.read.base, element));
    if (!row.overridden.empty()) row.note = "Overrides " + row.overridden;
  }

  void Finish(ReportObject& object) {
    for (ReportRow& row : object.rows) {
      Inherit(row, &ReportRow::left, &files_.read.left);
      Inherit(row, &ReportRow::right, &files_.read.right);
      Inherit(row, &ReportRow::result, files_.merged.get());
      if (files_.committed != nullptr) Inherit(row, &ReportRow::committed, &files_.committed->left);
    }
    for (const ReportRow& row : object.rows) rows_.MarkAbove(row);
    for (ReportRow& row : object.rows) {
      FinishRow(row);
      if (files_.committed != nullptr) NoteCommitted(row);
      TellApart(row, names_);
      object.pending |= row.pending;
      object.repaired |= row.repaired;
    }
    std::set<FieldPath> told;
    for (const ReportRow& row : object.rows) {
      const bool is_around = row.state == kInConflict && records_.IsAroundPending(row.path);
      if (is_around && IsToldByElements(row, object.rows)) told.insert(row.path);
    }
    std::erase_if(object.rows, [&](const ReportRow& row) { return told.contains(row.path); });
    std::ranges::stable_sort(object.rows, [](const ReportRow& a, const ReportRow& b) {
      const auto rank = [](const ReportRow& row) { return row.path.size() == 1 ? 0 : row.pending ? 1 : 2; };
      return rank(a) < rank(b);
    });
  }

  void FinishRow(ReportRow& row) {
    if (row.committed.kind == Kind::kUnchanged) FillFromBase(row, row.committed);
    if (files_.merged == nullptr) {
      row.result.text = "no result";
      return;
    }
    if (row.result.kind == Kind::kUnchanged) FillFromBase(row, row.result);
    if (row.repaired && row.state.empty()) row.state = "repaired";
    if (!row.state.empty()) return;
    if (row.left.kind == Kind::kUnchanged && row.right.kind == Kind::kUnchanged &&
        row.committed.kind != Kind::kUnchanged) {
      row.state = "only committed";
      return;
    }
    JudgeRow(row, sides_);
    if (row.state == "not taken" && records_.IsWaiting(row)) row.state = kInConflict;
  }

  // What somebody has made of a conflict, or of the merge's proposal.
  void NoteCommitted(ReportRow& row) {
    const bool is_open = row.pending || row.state == kInConflict;
    // The rows of the parts say it.
    if (is_open && row.committed.parts_changed) return;
    std::string note;
    if (!is_open) {
      if (row.note.empty() && !row.committed.HasSameValue(row.result))
        note = "Committed otherwise than merged";
    } else if (row.committed.kind == Kind::kUnchanged) {
      note = "Committed as it was before";
    } else if (row.committed.HasSameValue(row.left)) {
      note = "Committed: " + sides_.left;
    } else if (row.committed.HasSameValue(row.right)) {
      note = "Committed: " + sides_.right;
    } else {
      note = "Committed otherwise than either side has it";
    }
    if (!note.empty()) row.note += (row.note.empty() ? "" : "; ") + note;
  }

  static void FillFromBase(const ReportRow& row, ReportCell& cell) {
    cell.text = row.base.text;
    cell.full = row.base.full;
    cell.shown = row.base.shown;
    cell.node = row.base.node;
  }

  // What happened to the whole happened to the part.
  void Inherit(ReportRow& row, ReportCell ReportRow::*cell, const VexelObjects* version) {
    FieldPath path = row.path;
    while ((row.*cell).kind == Kind::kUnchanged && path.size() > 1) {
      path.pop_back();
      const auto gone = gone_.find(path);
      if (gone != gone_.end() && std::ranges::count(gone->second, cell) > 0) {
        (row.*cell).kind = Kind::kRemoved;
        return;
      }
      const ReportRow* const whole = rows_.Find(path);
      if (whole == nullptr) continue;
      const Kind kind = (whole->*cell).kind;
      if (kind == Kind::kUnchanged || kind == Kind::kEdited) continue;
      const YAMLNode* node = kind == Kind::kRemoved ? nullptr : NodeAt(version, row.path);
      if (node != nullptr) {
        row.*cell = ValueCell(row.path, node, kind, names_.In(cell));
      } else if (!row.base.text.empty()) {
        (row.*cell).kind = Kind::kRemoved;
      }
      return;
    }
  }

  const MergedFiles& files_;
  VersionNames& names_;
  const SideWords& sides_;
  ReportRows rows_{names_.Latest()};
  SideWalk::Places places_;
  RecordRows records_{files_, names_, sides_, places_, rows_};
  // Elements of lists, and the versions that they went out of.
  std::map<FieldPath, std::vector<ReportCell ReportRow::*>> gone_;
};

}  // namespace

VersionNames NamesOf(const MergedFiles& files) {
  return VersionNames({&files.read.base, &files.read.left, &files.read.right, files.merged.get(),
                       files.committed == nullptr ? nullptr : &files.committed->left});
}

std::vector<ReportObject> CollectReport(const MergedFiles& files, VersionNames& names,
                                        const SideWords& sides) {
  return Collector(files, names, sides).Collect();
}

}  // namespace vexel_yaml
