#include "report/record_rows.h"

#include <algorithm>

#include "report/report_places.h"

namespace vexel_yaml {

namespace {

using Kind = ReportCell::Kind;

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

}  // namespace

RecordRows::RecordRows(const MergedFiles& files, VersionNames& names, const SideWords& sides,
                       const SideWalk::Places& places, ReportRows& rows)
    : files_(files), names_(names), sides_(sides), places_(places), rows_(rows), patterns_(files.resolver) {
  for (const Record& record : files.resolver.GetRecords()) {
    if (IsPartOfReference(record.path)) ++reference_records_[Above(record.path)];
  }
}

void RecordRows::AddAll() {
  for (const Record& record : files_.resolver.GetRecords()) AddRecord(record);
}

void RecordRows::AddRecord(const Record& record) {
  const bool pending = record.resolution == MergeResolve::kConflict;
  if (!pending && record.resolution == MergeResolve::kAutomatic) return;
  // The order of the keys has records, too.
  if (!pending && record.path.front() == YAMLScalar::underscore) return;
  const FieldPath* const known = KnownPlace(record);
  const FieldPath place = PlaceOfWhole(known != nullptr ? *known : PlaceOfPart(record.path));
  const bool is_new = std::ranges::any_of(place, IsNewElement);
  ReportRow& row = rows_.RowAt(place);
  if (place.size() >= record.path.size()) {
    AddOperation(record.left, row, &ReportRow::left);
    AddOperation(record.right, row, &ReportRow::right);
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

const FieldPath* RecordRows::KnownPlace(const Record& record) const {
  for (const Operation* operation : {record.left, record.right}) {
    const auto found = places_.find(operation);
    if (found != places_.end()) return &found->second;
  }
  return nullptr;
}

// What two additions are merged from is in neither side's diff. Its record counts the elements of the
// merged list, where another one stands at the index than in base. Where scenes are merged as scenes, it
// counts those of base, and says so of what base lacks.
FieldPath RecordRows::PlaceOfPart(FieldPath path) const {
  if (files_.settled != nullptr) return path;
  for (size_t i = 1; i < path.size(); ++i) {
    const YAMLNode* parent = NodeAt(&files_.read.base, {path.begin(), path.begin() + static_cast<long>(i)});
    if (parent == nullptr) break;
    if (parent->AsSequence() != nullptr) path[i] = YAMLScalar::Lookup(kNewElement + path[i]->GetText());
  }
  return path;
}

// People know a reference as one value, of which a record may name a part.
FieldPath RecordRows::PlaceOfWhole(FieldPath path) {
  const auto records = reference_records_.find(Above(path));
  const bool is_only_one = records != reference_records_.end() && records->second == 1;
  return is_only_one && IsPartOfReference(path) && rows_.Find(records->first) != nullptr ? records->first
                                                                                         : path;
}

// The walks know an element that nothing identifies by its content: an edited one is gone for them, and
// another one came. The record knows that they are one.
void RecordRows::ShowElement(const Record& record, ReportRow& row) {
  const YAMLNode* list = NodeAt(&files_.read.base, Above(row.path));
  const YAMLNode* base = NodeAt(&files_.read.base, row.path);
  if (base == nullptr || list->AsSequence() == nullptr) return;
  const auto cell_of = [&](const Operation* edit, ReportCell ReportRow::*column) {
    const YAMLNode* node = After(base, edit);
    if (node == nullptr) return ReportCell{Kind::kRemoved, {}, {}};
    return ValueCell(row.path, node, edit == nullptr ? Kind::kUnchanged : Kind::kChanged, names_.In(column));
  };
  row.base = cell_of(nullptr, &ReportRow::base);
  row.left = cell_of(record.left, &ReportRow::left);
  row.right = cell_of(record.right, &ReportRow::right);
  ReportCell chosen = record.resolution == MergeResolve::kLeft    ? row.left
                      : record.resolution == MergeResolve::kRight ? row.right
                                                                  : row.base;
  if (IsInResult(Above(row.path), chosen)) row.result = std::move(chosen);
  if (files_.committed == nullptr) return;
  const auto committed = FindElement(row.path, files_.committed->base, files_.committed->left);
  const YAMLNode* node = committed.value_or(nullptr);
  if (node != nullptr && node->HasSameContent(*base)) return;
  row.committed = !committed ? ReportCell{Kind::kChanged, std::string(kSeeList), {}}
                  : node == nullptr
                      ? ReportCell{Kind::kRemoved, {}, {}}
                      : ValueCell(row.path, node, Kind::kChanged, names_.In(&ReportRow::committed));
}

// Whether the merged list at `path` has what a choice asked for: a repair may have taken it out again.
bool RecordRows::IsInResult(const FieldPath& path, const ReportCell& cell) const {
  const YAMLNode* list = NodeAt(files_.merged.get(), path);
  if (list == nullptr || list->AsSequence() == nullptr) return false;
  return cell.node == nullptr ||
         std::ranges::any_of(list->AsSequence()->GetItems(),
                             [&](const YAMLNode* item) { return item->HasSameContent(*cell.node); });
}

// What a new element overrides, empty for another one.
std::string RecordRows::OverriddenBy(const FieldPath& place) const {
  const auto step = std::ranges::find_if(place, IsNewElement);
  FieldPath path(place.begin(), step);
  path.push_back(YAMLScalar::Lookup((*step)->GetText().substr(1)));
  const std::string in_left = PropertyOf(NodeAt(&files_.read.left, path));
  return in_left.empty() ? PropertyOf(NodeAt(&files_.read.right, path)) : in_left;
}

// What nothing is decided about as long as a record is pending: the values around its place, and the
// objects that its edits name.
void RecordRows::NoteWhatWaits(const Record& record, FieldPath place) {
  if (place.size() == 1) pending_things_.insert(place.front());
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

bool RecordRows::IsAboutObjects(const Operation& operation) const {
  const YAMLMappingDiff* diff = static_cast<const ChangeMappingOperation&>(operation).GetDiff();
  return std::ranges::any_of(diff->GetEntries(), [&](const YAMLMappingDiff::Entry& entry) {
    return files_.read.base.HasKey(entry.key);
  });
}

bool RecordRows::IsWaiting(ReportRow& row) {
  if (rows_.IsInConflict(row.path) || around_pending_.contains(row.path)) return true;
  const YAMLScalar* const holder = FindHolder(row.path.front());
  if (holder == nullptr) return false;
  if (row.note.empty()) row.note = "Goes with the conflict at " + names_.Latest().Describe(holder);
  return true;
}

// The thing whose conflict decides about an object; null for none.
const YAMLScalar* RecordRows::FindHolder(const YAMLScalar* file_id) const {
  const auto waiting = waiting_.find(file_id);
  if (waiting != waiting_.end()) return waiting->second;
  if (pending_things_.empty()) return nullptr;
  const ObjectNames& names = names_.Latest();
  std::unordered_set<const YAMLScalar*> seen;
  const YAMLScalar* step = names.GetWhole(file_id);
  while (step != nullptr && !pending_things_.contains(step)) {
    // Of a hierarchy that is a circle nothing hangs on anything else.
    step = seen.insert(step).second ? names.GetParent(step) : nullptr;
  }
  return step;
}

// A record may be about a place that no walk has shown: an object as a whole, or a part of one that both
// sides added.
void RecordRows::AddOperation(const Operation* operation, ReportRow& row, ReportCell ReportRow::*column) {
  ReportCell& cell = row.*column;
  if (operation == nullptr || cell.kind != Kind::kUnchanged) return;
  switch (operation->GetKind()) {
    case Operation::Kind::kRemove:
      cell.kind = Kind::kRemoved;
      return;
    case Operation::Kind::kAdd:
    case Operation::Kind::kChange: {
      const Kind kind = operation->GetKind() == Operation::Kind::kAdd ? Kind::kAdded : Kind::kChanged;
      cell = ValueCell(row.path, static_cast<const ValuedOperation*>(operation)->GetValue(), kind,
                       names_.In(column));
      return;
    }
    case Operation::Kind::kChangeMapping:
      // What it did to other objects, which make a circle with this one: here it left everything alone.
      if (row.path.size() > 1 && IsAboutObjects(*operation)) return;
      [[fallthrough]];
    case Operation::Kind::kChangeSequence:
      cell = ChangedInside();
      if (!row.base.text.empty()) return;
      row.base = ValueCell(row.path, NodeAt(&files_.read.base, row.path), Kind::kUnchanged,
                           names_.In(&ReportRow::base));
      return;
  }
}

}  // namespace vexel_yaml
