#include "report/list_edit_text.h"

#include <algorithm>

#include "report/report_places.h"
#include "report/side_walk.h"

namespace vexel_yaml {

namespace {

constexpr size_t kMostOfText = 200;

std::string CountText(const ChangeSequenceOperation& edit) {
  size_t added = 0;
  for (const auto& [index, change] : edit.GetDiff()->GetEntries()) {
    if (change != nullptr && change->GetKind() == Operation::Kind::kAdd) ++added;
  }
  const size_t edited = edit.GetDiff()->GetEntries().size() - added;
  if (added == 0 && edited == 0) return "removes from it or reorders it";
  const std::string adds = "adds " + std::to_string(added);
  const std::string edits = "edits " + std::to_string(edited);
  return added == 0 ? edits + " of it" : edited == 0 ? adds + " to it" : adds + " to it, " + edits + " of it";
}

std::string InWords(std::string_view line) {
  if (line.starts_with("+ ")) return "adds " + std::string(line.substr(2));
  if (line.starts_with("- ")) return "removes " + std::string(line.substr(2));
  return std::string(line);
}

}  // namespace

std::string ListEditText(const ChangeSequenceOperation& edit, const YAMLNode* base, ObjectNames& names,
                         NamedWith with) {
  const YAMLNode* after = After(base, &edit);
  if (after == nullptr || base->AsSequence() == nullptr) return CountText(edit);
  std::string lines;
  size_t edited = 0;
  const auto found = [&](const FieldPath& path, const ReportCell& cell, const YAMLNode*) {
    if (!path.empty()) {
      ++edited;
    } else if (with == NamedWith::kNothing) {
      lines = cell.ForPeople();
    } else {
      lines = cell.full.empty() ? cell.text : cell.full;
    }
  };
  SideWalk(
      names, found, [](const FieldPath&) {}, nullptr)
      .WalkList(edit, *base->AsSequence(), *after->AsSequence());
  std::string text;
  for (std::string_view rest = lines; !rest.empty();) {
    const std::string_view line = rest.substr(0, rest.find('\n'));
    rest.remove_prefix(std::min(line.size() + 1, rest.size()));
    text += (text.empty() ? "" : ", ") + InWords(line);
  }
  if (edited > 0) text += (text.empty() ? "edits " : ", edits ") + std::to_string(edited) + " of it";
  if (text.empty()) return "leaves it";
  return with == NamedWith::kNothing ? Shortened(text, kMostOfText) : text;
}

}  // namespace vexel_yaml
