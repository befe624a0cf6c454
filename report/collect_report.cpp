#include <algorithm>
#include <array>

#include "report/side_walk.h"

namespace vexel_yaml {

namespace {

using Kind = ReportCell::Kind;
using Record = RecordingConflictResolver::Record;

ObjectNames NamesFor(const MergedFiles& files) {
  std::vector<const VexelObjects*> versions = {&files.read.right, &files.read.left, &files.read.base};
  if (files.merged != nullptr) versions.insert(versions.begin(), files.merged.get());
  return ObjectNames(std::move(versions));
}

// What stands at `path` below `node`; the path leads through mappings and lists.
const YAMLNode* NodeAt(const YAMLNode* node, const FieldPath& path) {
  for (const YAMLScalar* step : path) {
    if (node == nullptr) return nullptr;
    if (const YAMLMapping* mapping = node->AsMapping()) {
      node = mapping->HasDuplicateKeys() ? nullptr : mapping->Get(step);
    } else if (const YAMLSequence* sequence = node->AsSequence()) {
      const auto index = static_cast<size_t>(step->GetIntValue());
      node = index < sequence->Size() ? sequence->GetItems()[index] : nullptr;
    } else {
      return nullptr;
    }
  }
  return node;
}

// What an override of a prefab instance is about, empty for another value.
std::string PropertyOf(const YAMLNode* element) {
  const YAMLNode* property = NodeAt(element, {YAMLScalar::Lookup("propertyPath")});
  return property == nullptr || property->AsScalar() == nullptr ? std::string()
                                                                : property->AsScalar()->GetText();
}

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
  explicit Collector(const MergedFiles& files) : files_(files), names_(NamesFor(files)) {}

  std::vector<ReportObject> Collect() {
    AddSide(&ReportRow::left, &ReportObject::left, *files_.diffs.left, files_.read.left);
    AddSide(&ReportRow::right, &ReportObject::right, *files_.diffs.right, files_.read.right);
    if (files_.merged != nullptr) {
      AddResult();
      AddRepairs();
    }
    AddRenumbered();
    for (const Record& record : files_.resolver.GetRecords()) AddRecord(record);
    for (ReportObject& object : objects_) Finish(object);
    std::ranges::stable_sort(objects_, [](const ReportObject& a, const ReportObject& b) {
      if (a.pending != b.pending) return a.pending;
      if (a.path.empty() != b.path.empty()) return b.path.empty();
      return a.path < b.path;
    });
    return std::move(objects_);
  }

 private:
  struct Place {
    size_t object;
    size_t row;
  };

  void AddSide(ReportCell ReportRow::*cell, bool ReportObject::*side, const YAMLMappingDiff& diff,
               const VexelObjects& to) {
    const auto found = [&](const FieldPath& path, ReportCell change, const YAMLNode* from) {
      ReportObject& object = objects_[ObjectAt(path.front())];
      object.*side = true;
      const bool whole = path.size() == 1;
      object.added |= whole && change.kind == Kind::kAdded;
      object.removed |= whole && change.kind == Kind::kRemoved;
      object.changed |= !whole || change.kind == Kind::kChanged;
      SetCell(path, cell, std::move(change), from);
      if (path.back() == YAMLScalar::mFather) RowAt(path).note = "Moved to another parent";
    };
    SideWalk(names_, found, GoneIn(cell), &places_).Walk(diff, files_.read.base, to);
  }

  SideWalk::Gone GoneIn(ReportCell ReportRow::*cell) {
    return [this, cell](const FieldPath& path) { gone_[PathToString(path)].push_back(cell); };
  }

  void AddResult() {
    const auto found = [&](const FieldPath& path, ReportCell change, const YAMLNode* from) {
      SetCell(path, &ReportRow::result, std::move(change), from);
    };
    const YAMLMapping& base = files_.read.base;
    SideWalk(names_, found, GoneIn(&ReportRow::result), nullptr)
        .Walk(*YAMLMappingDiff::Diff(base, *files_.merged), base, *files_.merged);
  }

  void AddRepairs() {
    const auto found = [&](const FieldPath& path, const ReportCell& change, const YAMLNode* from) {
      ReportRow& row = RowAt(path);
      row.repaired = true;
      if (path.size() == 1 || from == nullptr) {
        row.note = change.kind == Kind::kRemoved ? "Removed by the repairs" : "Added by the repairs";
      } else {
        row.note = "Before the repair: " + ValueCell(path, from, Kind::kUnchanged, names_).text;
      }
      if (row.result.kind == Kind::kUnchanged && change.kind != Kind::kUnchanged) row.result = change;
    };
    SideWalk(
        names_, found, [](const FieldPath&) {}, nullptr)
        .Walk(*YAMLMappingDiff::Diff(*files_.unrepaired, *files_.merged), *files_.unrepaired, *files_.merged);
  }

  void AddRenumbered() {
    for (const RenumberedObject& renumbered : files_.renumbered) {
      ReportRow& row = RowAt({renumbered.new_id});
      row.repaired = true;
      row.note = "Both sides added another object as " + renumbered.old_id->GetText() +
                 "; right's was given a file ID of its own";
    }
  }

  void AddRecord(const Record& record) {
    const bool pending = record.resolution == MergeResolve::kConflict;
    if (!pending && record.resolution == MergeResolve::kAutomatic) return;
    // The order of the keys has records, too.
    if (!pending && record.path.front() == YAMLScalar::underscore) return;
    ReportRow& row = RowAt(PlaceOf(record));
    AddOperation(record.left, row, row.left);
    AddOperation(record.right, row, row.right);
    row.pending |= pending;
    row.state = pending ? "conflict" : SettledState(record.resolution);
    row.record_path = PathToString(record.path);
    if (record.type == ConflictType::kTransformCycle) {
      row.note = "The parents of the transforms formed a circle; it was broken here";
    } else if (const std::string_view dependency = DependencyText(record); !dependency.empty()) {
      const bool from_left = IsLeftType(record.type);
      row.note = std::string(from_left ? "Left " : "Right ") + std::string(dependency);
      ReportObject& object = objects_[ObjectAt(row.path.front())];
      (from_left ? object.left : object.right) = true;
    }
  }

  const FieldPath& PlaceOf(const Record& record) const {
    for (const Operation* operation : {record.left, record.right}) {
      const auto found = places_.find(operation);
      if (found != places_.end()) return found->second;
    }
    return record.path;
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
      case Operation::Kind::kChangeSequence:
        cell = {Kind::kEdited, "changed inside", {}};
        if (!row.base.text.empty()) return;
        row.base = ValueCell(row.path, NodeAt(&files_.read.base, row.path), Kind::kUnchanged, names_);
        return;
    }
  }

  void SetCell(const FieldPath& path, ReportCell ReportRow::*cell, ReportCell change, const YAMLNode* from) {
    ReportRow& row = RowAt(path);
    row.*cell = std::move(change);
    if (!row.base.text.empty() || from == nullptr) return;
    row.base = ValueCell(path, from, Kind::kUnchanged, names_);
    // Of the many overrides of a prefab instance, which tell people nothing by their numbers.
    const FieldPath element(path.begin(), path.end() - 1);
    const std::string property = PropertyOf(NodeAt(&files_.read.base, element));
    if (!property.empty()) row.note = "Overrides " + property;
  }

  size_t ObjectAt(const YAMLScalar* file_id) {
    const auto [entry, is_new] = object_places_.try_emplace(file_id, objects_.size());
    if (is_new) {
      ReportObject& object = objects_.emplace_back();
      object.file_id = file_id;
      object.class_name = names_.GetClass(file_id);
      object.path = names_.GetPath(file_id);
    }
    return entry->second;
  }

  ReportRow& RowAt(const FieldPath& path) {
    const size_t object = ObjectAt(path.front());
    std::vector<ReportRow>& rows = objects_[object].rows;
    const auto [entry, is_new] = row_places_.try_emplace(PathToString(path), Place{object, rows.size()});
    if (is_new) rows.emplace_back().path = path;
    return rows[entry->second.row];
  }

  void Finish(ReportObject& object) {
    for (ReportRow& row : object.rows) FinishRow(row);
    for (const ReportRow& row : object.rows) {
      object.pending |= row.pending;
      object.repaired |= row.repaired;
    }
    std::ranges::stable_sort(object.rows, [](const ReportRow& a, const ReportRow& b) {
      const auto rank = [](const ReportRow& row) { return row.path.size() == 1 ? 0 : row.pending ? 1 : 2; };
      return rank(a) < rank(b);
    });
  }

  void FinishRow(ReportRow& row) {
    Inherit(row, &ReportRow::left, &files_.read.left);
    Inherit(row, &ReportRow::right, &files_.read.right);
    Inherit(row, &ReportRow::result, files_.merged.get());
    if (files_.merged == nullptr) {
      row.result.text = "no result";
      return;
    }
    if (row.result.kind == Kind::kUnchanged) row.result.text = row.base.text;
    if (row.result.kind == Kind::kUnchanged) row.result.full = row.base.full;
    if (row.repaired && row.state.empty()) row.state = "repaired";
    if (row.state.empty()) row.state = StateOf(row);
  }

  // What happened to the whole happened to the part.
  void Inherit(ReportRow& row, ReportCell ReportRow::*cell, const VexelObjects* version) {
    FieldPath path = row.path;
    while ((row.*cell).kind == Kind::kUnchanged && path.size() > 1) {
      path.pop_back();
      const auto gone = gone_.find(PathToString(path));
      if (gone != gone_.end() && std::ranges::count(gone->second, cell) > 0) {
        (row.*cell).kind = Kind::kRemoved;
        return;
      }
      const auto found = row_places_.find(PathToString(path));
      if (found == row_places_.end()) continue;
      const ReportRow& whole = objects_[found->second.object].rows[found->second.row];
      const Kind kind = (whole.*cell).kind;
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

  static std::string_view StateOf(const ReportRow& row) {
    const bool left = row.left.kind != Kind::kUnchanged;
    const bool right = row.right.kind != Kind::kUnchanged;
    const bool is_left = left && row.result == row.left;
    const bool is_right = right && row.result == row.right;
    if (is_left && is_right) return "same on both";
    if (left && right && row.result.kind == Kind::kEdited) return "merged";
    if (is_left) return "from left";
    if (is_right) return "from right";
    return (left || right) && row.result.kind == Kind::kUnchanged ? "not taken" : "merged";
  }

  const MergedFiles& files_;
  ObjectNames names_;
  std::vector<ReportObject> objects_;
  std::unordered_map<const YAMLScalar*, size_t> object_places_;
  std::unordered_map<std::string, Place> row_places_;
  SideWalk::Places places_;
  // Elements of lists, and the versions that they went out of.
  std::unordered_map<std::string, std::vector<ReportCell ReportRow::*>> gone_;
};

}  // namespace

std::vector<ReportObject> CollectReport(const MergedFiles& files) { return Collector(files).Collect(); }

}  // namespace vexel_yaml
