#include "report/report_model.h"

#include <algorithm>
#include <set>
#include <unordered_map>

#include "report/side_walk.h"
#include "report/version_names.h"

namespace vexel_yaml {

namespace {

using Kind = ReportCell::Kind;

// The edits of a list but its order, which shows elements that others may have changed.
std::set<std::string_view> Edits(const ReportCell& cell) {
  std::set<std::string_view> edits;
  std::string_view rest = cell.full.empty() ? cell.text : cell.full;
  while (!rest.empty()) {
    const std::string_view line = rest.substr(0, rest.find('\n'));
    rest.remove_prefix(std::min(line.size() + 1, rest.size()));
    if (line != kChangedInside && !line.starts_with(kNewOrder)) edits.insert(line);
  }
  return edits;
}

// Whether the elements that `side` moved stand in its order in the result, as far as they are there.
bool HoldsOrder(const ReportCell& result, const ReportCell& side) {
  if (std::ranges::is_sorted(side.order)) return true;
  const bool is_list = result.kind == Kind::kUnchanged || result.kind == Kind::kEdited;
  if (is_list && result.order.empty()) return false;
  std::unordered_map<uint32_t, size_t> places;
  for (const uint32_t element : result.order) places.emplace(element, places.size());
  std::vector<size_t> order;
  for (const uint32_t element : side.order) {
    const auto found = places.find(element);
    if (found != places.end()) order.push_back(found->second);
  }
  return std::ranges::is_sorted(order);
}

bool Holds(const ReportCell& result, const ReportCell& side) {
  return std::ranges::includes(Edits(result), Edits(side)) && HoldsOrder(result, side) &&
         (result.parts_changed || !side.parts_changed);
}

std::string_view StateOf(const ReportRow& row) {
  const bool left = row.left.kind != Kind::kUnchanged;
  const bool right = row.right.kind != Kind::kUnchanged;
  if ((left || right) && row.result.kind == Kind::kUnchanged) return "not taken";
  if (left != right) return left ? "from left" : "from right";
  bool is_left = row.result.HasSameValue(row.left);
  bool is_right = row.result.HasSameValue(row.right);
  if (is_left && is_right && !row.result.parts_changed) return "same on both";
  if (row.result.kind == Kind::kEdited) {
    is_left = Holds(row.result, row.left);
    is_right = Holds(row.result, row.right);
  }
  if (is_left == is_right) return "merged";
  return is_left ? "from left" : "from right";
}

}  // namespace

void JudgeRow(ReportRow& row, const SideWords& sides) {
  row.state = StateOf(row);
  const bool lost_left = !HoldsOrder(row.result, row.left);
  const bool lost_right = !HoldsOrder(row.result, row.right);
  if (!lost_left && !lost_right) return;
  row.note = !lost_right  ? sides.left + "'s new order was not taken"
             : !lost_left ? sides.right + "'s new order was not taken"
                          : "Neither side's new order was taken";
}

bool IsToldByElements(const ReportRow& list, const std::vector<ReportRow>& rows) {
  if (list.base.node == nullptr || list.base.node->AsSequence() == nullptr) return false;
  constexpr ReportCell ReportRow::*kVersions[] = {&ReportRow::left, &ReportRow::right, &ReportRow::committed};
  return std::ranges::all_of(kVersions, [&](const auto version) {
    const ReportCell& edits = list.*version;
    if (edits.kind == Kind::kUnchanged) return true;
    size_t told = 0;
    for (const ReportRow& row : rows) {
      const bool is_element = row.path.size() == list.path.size() + 1 &&
                              std::equal(list.path.begin(), list.path.end(), row.path.begin());
      const ReportCell& cell = row.*version;
      if (!is_element || cell.kind == Kind::kUnchanged || cell.text == kSeeList) continue;
      told += cell.kind == Kind::kChanged ? 2 : 1;
    }
    return edits.kind == Kind::kEdited && std::ranges::is_sorted(edits.order) && Edits(edits).size() <= told;
  });
}

std::string InWordsOfPeople(std::string_view state) {
  const size_t word = state.rfind(' ') + 1;
  const std::string_view side = state.substr(word);
  const std::string_view known = side == "left" ? "theirs" : side == "right" ? "ours" : side;
  return std::string(state.substr(0, word)) + std::string(known);
}

void TellApart(ReportRow& row, VersionNames& names) {
  constexpr ReportCell ReportRow::*kColumns[] = {&ReportRow::base, &ReportRow::left, &ReportRow::right,
                                                 &ReportRow::result, &ReportRow::committed};
  const auto looks_like_another = [&](const auto column) {
    const ReportCell& cell = row.*column;
    return !cell.shown.empty() && std::ranges::any_of(kColumns, [&](const auto other_column) {
      const ReportCell& other = row.*other_column;
      return other.shown == cell.shown && (other.text != cell.text || other.full != cell.full);
    });
  };
  if (std::ranges::none_of(kColumns, looks_like_another)) return;
  for (const auto column : kColumns) {
    ReportCell& cell = row.*column;
    // Of a list's edits, the exact text has the file IDs.
    cell.shown.clear();
    if (cell.kind != Kind::kEdited) ShowNamed(cell, names.In(column).own, NamedWith::kFileIDs);
  }
}

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
