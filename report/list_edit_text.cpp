#include "report/list_edit_text.h"

#include <algorithm>
#include <set>

#include "report/list_order.h"
#include "report/report_places.h"
#include "report/side_walk.h"

namespace vexel_yaml {

namespace {

constexpr size_t kMostOfText = 200;
constexpr size_t kMostOfOrder = 120;
constexpr size_t kMostOfElement = 60;
// Of what was added, and of what was removed.
constexpr size_t kMostNamed = 3;

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

struct Verb {
  std::string_view sign;
  std::string_view word;
  size_t count = 0;
};

void Append(std::string& text, std::string_view more) {
  text.append(text.empty() || more.empty() ? "" : ", ").append(more);
}

// The edits that stand on these lines, and behind them the order, of which nothing is lost to many edits.
std::string InWords(std::string_view lines, NamedWith with) {
  const bool is_whole = with != NamedWith::kNothing;
  std::string text, order;
  Verb verbs[] = {{"- ", "removes "}, {"+ ", "adds "}};
  while (!lines.empty()) {
    const std::string_view line = lines.substr(0, lines.find('\n'));
    lines.remove_prefix(std::min(line.size() + 1, lines.size()));
    const auto verb = std::ranges::find_if(verbs, [&](const Verb& v) { return line.starts_with(v.sign); });
    if (verb == std::end(verbs)) {
      order = line;
    } else if (++verb->count <= kMostNamed || is_whole) {
      Append(text, std::string(verb->word) + std::string(line.substr(verb->sign.size())));
    }
  }
  if (!is_whole) {
    for (const Verb& verb : verbs) {
      if (verb.count > kMostNamed)
        Append(text, std::string(verb.word) + std::to_string(verb.count - kMostNamed) + " more");
    }
    order = Shortened(order, kMostOfOrder);
    text = Shortened(text, kMostOfText - order.size());
  }
  Append(text, order);
  return text;
}

// The elements of base that an edit removes, changes or moves, or beside which it puts others.
void FindTouched(const YAMLSequence& base, const Operation* operation, std::set<size_t>& touched) {
  if (operation == nullptr || operation->GetKind() != Operation::Kind::kChangeSequence) return;
  const auto& edit = static_cast<const ChangeSequenceOperation&>(*operation);
  const YAMLSequence& after = *After(&base, &edit)->AsSequence();
  const std::vector<uint32_t> origins = Origins(edit.GetRemapper(), base.Size(), after.Size());
  const auto touch = [&](size_t place) {
    const bool is_there = place < after.Size() && origins[place] != YAMLSequenceRemapper::kDropped;
    if (is_there) touched.insert(origins[place]);
  };
  const std::set<uint32_t> kept(origins.begin(), origins.end());
  for (uint32_t i = 0; i < base.Size(); ++i) {
    if (!kept.contains(i)) touched.insert(i);
  }
  for (const size_t place : FindMoved(origins, after.Size())) touch(place);
  for (const auto& [index, element] : edit.GetDiff()->GetEntries()) touch(static_cast<size_t>(index));
  for (size_t place = 0; place < after.Size(); ++place) {
    if (origins[place] != YAMLSequenceRemapper::kDropped) continue;
    touch(place + 1);
    if (place > 0) touch(place - 1);
  }
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
      {names, names}, found, [](const FieldPath&) {}, nullptr)
      .WalkList(edit, *base->AsSequence(), *after->AsSequence());
  std::string text = InWords(lines, with);
  if (edited > 0) Append(text, "edits " + std::to_string(edited) + " of it");
  return text.empty() ? "leaves it" : text;
}

std::string ListBeforeText(const YAMLSequence& list, const Operation* left, const Operation* right,
                           ObjectNames& names) {
  std::set<size_t> touched;
  FindTouched(list, left, touched);
  FindTouched(list, right, touched);
  std::vector<std::string> elements = NamedElements(list, names);
  for (std::string& element : elements) element = Shortened(element, kMostOfElement);
  return '[' + Shortened(Elided(elements, touched), kMostOfText) + ']';
}

}  // namespace vexel_yaml
