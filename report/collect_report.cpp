#include <algorithm>
#include <map>
#include <set>
#include <unordered_map>

#include "report/natural_order.h"
#include "report/record_patterns.h"
#include "report/report_places.h"
#include "report/report_rows.h"
#include "report/shown_diff.h"
#include "report/side_walk.h"

namespace vexel_yaml {

namespace {

using Kind = ReportCell::Kind;
using Record = RecordingConflictResolver::Record;

std::string_view SettledState(MergeResolve resolution) {
  switch (resolution) {
    case MergeResolve::kLeft:
      return "settled: left";
    case MergeResolve::kRight:
      return "settled: right";
    default:
      return "settled: base";
  }
}

class Collector {
 public:
  Collector(const MergedFiles& files, ObjectNames& names, const SideWords& sides)
      : files_(files), names_(names), sides_(sides), patterns_(files.resolver) {
    for (const Record& record : files.resolver.GetRecords()) {
      if (IsPartOfReference(record.path)) ++reference_records_[Above(record.path)];
    }
  }

  std::vector<ReportObject> Collect() {
    AddSide(&ReportRow::left, &ReportObject::left, *files_.diffs.left, files_.read.left);
    AddSide(&ReportRow::right, &ReportObject::right, *files_.diffs.right, files_.read.right);
    if (files_.merged != nullptr) {
      AddResult();
      AddRepairs();
    }
    if (files_.committed != nullptr) AddCommitted();
    AddRenumbered();
    for (const Record& record : files_.resolver.GetRecords()) AddRecord(record);
    for (ReportObject& object : rows_.Objects()) Finish(object);
    std::ranges::stable_sort(rows_.Objects(), [](const ReportObject& a, const ReportObject& b) {
      if (a.pending != b.pending) return a.pending;
      if (a.path.empty() != b.path.empty()) return b.path.empty();
      return ComesBefore(a.path, b.path);
    });
    return std::move(rows_.Objects());
  }

 private:
  void AddSide(ReportCell ReportRow::*cell, bool ReportObject::*side, const YAMLMappingDiff& diff,
               const VexelObjects& to) {
    const auto found = [&](const FieldPath& path, ReportCell change, const YAMLNode* from) {
      ReportObject& object = rows_.ObjectAt(path.front());
      object.*side = true;
      const bool whole = path.size() == 1;
      object.added |= whole && change.kind == Kind::kAdded;
      object.removed |= whole && change.kind == Kind::kRemoved;
      object.changed |= !whole || change.kind == Kind::kChanged;
      SetCell(path, cell, std::move(change), from);
      if (path.back() == YAMLScalar::mFather) rows_.RowAt(path).note = "Moved to another parent";
    };
    SideWalk(names_, found, GoneIn(cell), &places_).Walk(diff, files_.read.base, to);
  }

  SideWalk::Gone GoneIn(ReportCell ReportRow::*cell) {
    return [this, cell](const FieldPath& path) { gone_[path].push_back(cell); };
  }

  void AddResult() {
    const auto found = [&](const FieldPath& path, ReportCell change, const YAMLNode* from) {
      SetCell(path, &ReportRow::result, std::move(change), from);
    };
    const YAMLMapping& base = files_.read.base;
    SideWalk(names_, found, GoneIn(&ReportRow::result), nullptr)
        .Walk(*DiffToShow(base, *files_.merged), base, *files_.merged);
  }

  void AddCommitted() {
    const auto found = [&](const FieldPath& path, ReportCell change, const YAMLNode* from) {
      rows_.ObjectAt(path.front()).changed = true;
      SetCell(path, &ReportRow::committed, std::move(change), from);
    };
    const auto& [base, committed, same] = static_cast<const MergeDocuments&>(*files_.committed);
    SideWalk(names_, found, GoneIn(&ReportRow::committed), nullptr)
        .Walk(*DiffToShow(base, committed), base, committed);
  }

  void AddRepairs() {
    const auto found = [&](const FieldPath& path, const ReportCell& change, const YAMLNode* from) {
      ReportRow& row = rows_.RowAt(path);
      row.repaired = true;
      if (path.size() == 1 || from == nullptr) {
        row.note = change.kind == Kind::kRemoved ? "Removed by the repairs" : "Added by the repairs";
      } else {
        row.note = "Before the repair: " + ValueCell(path, from, Kind::kUnchanged, names_).ForPeople();
      }
      if (row.result.kind == Kind::kUnchanged && change.kind != Kind::kUnchanged) row.result = change;
    };
    SideWalk(
        names_, found, [](const FieldPath&) {}, nullptr)
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

  void AddRecord(const Record& record) {
    const bool pending = record.resolution == MergeResolve::kConflict;
    if (!pending && record.resolution == MergeResolve::kAutomatic) return;
    // The order of the keys has records, too.
    if (!pending && record.path.front() == YAMLScalar::underscore) return;
    const FieldPath* const known = KnownPlace(record);
    const FieldPath place = PlaceOfWhole(known != nullptr ? *known : PlaceOfPart(record.path));
    const bool is_new = std::ranges::any_of(place, IsNewElement);
    ReportRow& row = rows_.RowAt(place);
    if (place.size() >= record.path.size()) {
      AddOperation(record.left, row, row.left);
      AddOperation(record.right, row, row.right);
    }
    if (files_.settled != nullptr) ShowElement(record, row);
    if (is_new) row.overridden = OverriddenBy(place);
    if (known == nullptr && is_new) {
      row.note = "Part of what both sides added to the list";
      // No walk over the result comes by here.
      const bool is_right = record.resolution == MergeResolve::kRight;
      // Base has none, so that left's stands for it in a scene.
      const bool is_left = record.resolution == MergeResolve::kLeft || files_.settled != nullptr;
      if (is_right || is_left) row.result = is_right ? row.right : row.left;
    }
    row.pending |= pending;
    if (pending) NoteWhatWaits(record, place);
    row.state = pending ? "conflict" : SettledState(record.resolution);
    row.record_path = patterns_.For(record);
    if (record.type == ConflictType::kTransformCycle) {
      row.note = "The parents of the transforms formed a circle; it was broken here";
    } else if (const std::string_view dependency = DependencyText(record); !dependency.empty()) {
      const bool from_left = IsLeftType(record.type);
      row.note = (from_left ? sides_.left : sides_.right) + ' ' + std::string(dependency);
      ReportObject& object = rows_.ObjectAt(row.path.front());
      (from_left ? object.left : object.right) = true;
    }
  }

  const FieldPath* KnownPlace(const Record& record) const {
    for (const Operation* operation : {record.left, record.right}) {
      const auto found = places_.find(operation);
      if (found != places_.end()) return &found->second;
    }
    return nullptr;
  }

  // What two additions are merged from is in neither side's diff. Its record counts the elements of the
  // merged list, where another one stands at the index than in base. Where scenes are merged as scenes, it
  // counts those of base, and says so of what base lacks.
  FieldPath PlaceOfPart(FieldPath path) const {
    if (files_.settled != nullptr) return path;
    for (size_t i = 1; i < path.size(); ++i) {
      const YAMLNode* parent = NodeAt(&files_.read.base, {path.begin(), path.begin() + static_cast<long>(i)});
      if (parent == nullptr) break;
      if (parent->AsSequence() != nullptr) path[i] = YAMLScalar::Lookup(kNewElement + path[i]->GetText());
    }
    return path;
  }

  // People know a reference as one value, of which a record may name a part.
  FieldPath PlaceOfWhole(FieldPath path) {
    const auto records = reference_records_.find(Above(path));
    const bool is_only_one = records != reference_records_.end() && records->second == 1;
    return is_only_one && IsPartOfReference(path) && rows_.Find(records->first) != nullptr ? records->first
                                                                                           : path;
  }

  // The walks know an element that nothing identifies by its content: an edited one is gone for them, and
  // another one came. The record knows that they are one.
  void ShowElement(const Record& record, ReportRow& row) {
    const YAMLNode* list = NodeAt(&files_.read.base, Above(row.path));
    const YAMLNode* base = NodeAt(&files_.read.base, row.path);
    if (base == nullptr || list->AsSequence() == nullptr) return;
    const auto cell_of = [&](const Operation* edit) {
      const YAMLNode* node = After(base, edit);
      if (node == nullptr) return ReportCell{Kind::kRemoved, {}, {}};
      return ValueCell(row.path, node, edit == nullptr ? Kind::kUnchanged : Kind::kChanged, names_);
    };
    row.base = cell_of(nullptr);
    row.left = cell_of(record.left);
    row.right = cell_of(record.right);
    ReportCell chosen = record.resolution == MergeResolve::kLeft    ? row.left
                        : record.resolution == MergeResolve::kRight ? row.right
                                                                    : row.base;
    if (IsInResult(Above(row.path), chosen)) row.result = std::move(chosen);
    if (files_.committed == nullptr) return;
    const auto committed = FindElement(row.path, files_.committed->base, files_.committed->left);
    const YAMLNode* node = committed.value_or(nullptr);
    if (node != nullptr && node->HasSameContent(*base)) return;
    row.committed = !committed        ? ReportCell{Kind::kChanged, "see the list", {}}
                    : node == nullptr ? ReportCell{Kind::kRemoved, {}, {}}
                                      : ValueCell(row.path, node, Kind::kChanged, names_);
  }

  // Whether the merged list at `path` has what a choice asked for: a repair may have taken it out again.
  bool IsInResult(const FieldPath& path, const ReportCell& cell) const {
    const YAMLNode* list = NodeAt(files_.merged.get(), path);
    if (list == nullptr || list->AsSequence() == nullptr) return false;
    return cell.node == nullptr ||
           std::ranges::any_of(list->AsSequence()->GetItems(),
                               [&](const YAMLNode* item) { return item->HasSameContent(*cell.node); });
  }

  // What a new element overrides, empty for another one.
  std::string OverriddenBy(const FieldPath& place) const {
    const auto step = std::ranges::find_if(place, IsNewElement);
    FieldPath path(place.begin(), step);
    path.push_back(YAMLScalar::Lookup((*step)->GetText().substr(1)));
    const std::string in_left = PropertyOf(NodeAt(&files_.read.left, path));
    return in_left.empty() ? PropertyOf(NodeAt(&files_.read.right, path)) : in_left;
  }

  // What nothing is decided about as long as a record is pending: the values around its place, and the
  // objects that its edits name.
  void NoteWhatWaits(const Record& record, FieldPath place) {
    for (place = Above(place); place.size() > 1; place = Above(place)) around_pending_.insert(place);
    for (const Operation* operation : {record.left, record.right}) {
      if (operation == nullptr || operation->GetKind() != Operation::Kind::kChangeMapping) continue;
      const YAMLMappingDiff* diff = static_cast<const ChangeMappingOperation*>(operation)->GetDiff();
      for (const YAMLMappingDiff::Entry& entry : diff->GetEntries()) {
        if (files_.read.left.HasKey(entry.key) || files_.read.right.HasKey(entry.key))
          waiting_.emplace(entry.key, record.path.front());
      }
    }
  }

  bool IsAboutObjects(const Operation& operation) const {
    const YAMLMappingDiff* diff = static_cast<const ChangeMappingOperation&>(operation).GetDiff();
    return std::ranges::any_of(diff->GetEntries(), [&](const YAMLMappingDiff::Entry& entry) {
      return files_.read.base.HasKey(entry.key);
    });
  }

  bool IsWaiting(ReportRow& row) {
    if (rows_.IsInConflict(row.path) || around_pending_.contains(row.path)) return true;
    const auto found = waiting_.find(row.path.front());
    if (found == waiting_.end()) return false;
    if (row.note.empty()) row.note = "Goes with the conflict at " + names_.Describe(found->second);
    return true;
  }

  // A record may be about a place that no walk has shown: an object as a whole, or a part of one that both
  // sides added.
  void AddOperation(const Operation* operation, ReportRow& row, ReportCell& cell) {
    if (operation == nullptr || cell.kind != Kind::kUnchanged) return;
    switch (operation->GetKind()) {
      case Operation::Kind::kRemove:
        cell.kind = Kind::kRemoved;
        return;
      case Operation::Kind::kAdd:
      case Operation::Kind::kChange: {
        const Kind kind = operation->GetKind() == Operation::Kind::kAdd ? Kind::kAdded : Kind::kChanged;
        cell = ValueCell(row.path, static_cast<const ValuedOperation*>(operation)->GetValue(), kind, names_);
        return;
      }
      case Operation::Kind::kChangeMapping:
        // What it did to other objects, which make a circle with this one: here it left everything alone.
        if (row.path.size() > 1 && IsAboutObjects(*operation)) return;
        [[fallthrough]];
      case Operation::Kind::kChangeSequence:
        cell = ChangedInside();
        if (!row.base.text.empty()) return;
        row.base = ValueCell(row.path, NodeAt(&files_.read.base, row.path), Kind::kUnchanged, names_);
        return;
    }
  }

  void SetCell(const FieldPath& path, ReportCell ReportRow::*cell, ReportCell change, const YAMLNode* from) {
    ReportRow& row = rows_.RowAt(path);
    row.*cell = std::move(change);
    if (!row.base.text.empty() || from == nullptr) return;
    row.base = ValueCell(path, from, Kind::kUnchanged, names_);
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
      TellApart(row, names_);
      object.pending |= row.pending;
      object.repaired |= row.repaired;
    }
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
    if (files_.committed != nullptr && row.note.empty() && !(row.committed == row.result)) {
      row.note = "Committed otherwise than merged";
    }
    if (row.repaired && row.state.empty()) row.state = "repaired";
    if (!row.state.empty()) return;
    if (row.left.kind == Kind::kUnchanged && row.right.kind == Kind::kUnchanged &&
        row.committed.kind != Kind::kUnchanged) {
      row.state = "only committed";
      return;
    }
    JudgeRow(row, sides_);
    if (row.state == "not taken" && IsWaiting(row)) row.state = "in conflict";
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
        row.*cell = ValueCell(row.path, node, kind, names_);
      } else if (!row.base.text.empty()) {
        (row.*cell).kind = Kind::kRemoved;
      }
      return;
    }
  }

  const MergedFiles& files_;
  ObjectNames& names_;
  const SideWords& sides_;
  ReportRows rows_{names_};
  RecordPatterns patterns_;
  SideWalk::Places places_;
  std::set<FieldPath> around_pending_;
  // Objects, and the thing whose conflict decides about each.
  std::unordered_map<const YAMLScalar*, const YAMLScalar*> waiting_;
  // How many records there are about parts of each reference.
  std::map<FieldPath, size_t> reference_records_;
  // Elements of lists, and the versions that they went out of.
  std::map<FieldPath, std::vector<ReportCell ReportRow::*>> gone_;
};

}  // namespace

ObjectNames NamesOf(const MergedFiles& files) {
  std::vector<const VexelObjects*> versions = {&files.read.right, &files.read.left, &files.read.base};
  if (files.merged != nullptr) versions.insert(versions.begin(), files.merged.get());
  return ObjectNames(std::move(versions));
}

std::vector<ReportObject> CollectReport(const MergedFiles& files, ObjectNames& names,
                                        const SideWords& sides) {
  return Collector(files, names, sides).Collect();
}

}  // namespace vexel_yaml
