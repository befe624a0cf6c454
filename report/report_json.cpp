#include "report/report_json.h"

#include <algorithm>
#include <nlohmann/json.hpp>

#include "report/named_note.h"
#include "report/typed_value.h"
#include "report/value_text.h"
#include "report/version_names.h"

namespace vexel_yaml {

namespace {

using Json = nlohmann::ordered_json;

std::string_view KindWord(ReportCell::Kind kind) {
  switch (kind) {
    case ReportCell::Kind::kUnchanged:
      return "unchanged";
    case ReportCell::Kind::kChanged:
      return "changed";
    case ReportCell::Kind::kEdited:
      return "edited";
    case ReportCell::Kind::kAdded:
      return "added";
    case ReportCell::Kind::kRemoved:
      return "removed";
  }
  return {};
}

Json ValueJson(const ReportCell& cell, bool is_switch, ObjectNames& names) {
  using Kind = TypedValue::Kind;
  const TypedValue value = TypedValueOf(cell.node, names);
  switch (value.kind) {
    case Kind::kNone:
      return nullptr;
    case Kind::kText:
      return value.is_empty ? Json{{"type", "text"}, {"empty", true}} : Json{{"type", "text"}};
    case Kind::kNumber:
      if (is_switch) return {{"type", "boolean"}, {"on", value.number == "1"}};
      return {{"type", "number"}, {"number", value.number}};
    case Kind::kVector: {
      Json parts = Json::object();
      for (const auto& [part, number] : value.parts) parts[part] = number;
      return {{"type", "vector"}, {"parts", parts}};
    }
    case Kind::kColour:
      return {{"type", "colour"},
              {"r", value.colour[0]},
              {"g", value.colour[1]},
              {"b", value.colour[2]},
              {"a", value.colour[3]}};
    case Kind::kReference:
      return {{"type", "reference"},
              {"id", Cleaned(value.id)},
              {"guid", Cleaned(value.guid)},
              {"name", OnOneLine(value.name)}};
  }
  return nullptr;
}

Json CellJson(const ReportCell& cell, bool is_switch, ObjectNames& names) {
  Json json = {{"kind", KindWord(cell.kind)}, {"text", Cleaned(cell.text)}};
  if (!cell.full.empty()) json["full"] = Cleaned(cell.full);
  if (!cell.shown.empty()) json["shown"] = Cleaned(cell.shown);
  // A list's cell tells its edits, and a mark inside says no more than that.
  json["value"] = cell.kind == ReportCell::Kind::kEdited ? Json() : ValueJson(cell, is_switch, names);
  return json;
}

constexpr ReportCell ReportRow::*kCells[] = {&ReportRow::base, &ReportRow::left, &ReportRow::right,
                                             &ReportRow::result};
constexpr std::string_view kCellNames[] = {"base", "theirs", "ours", "result"};

// Only where no version holds anything else: a field may be named like a switch and count something.
bool IsSwitchRow(const ReportRow& row) {
  const auto is_on_or_off = [](const ReportCell& cell) {
    return cell.node == nullptr || cell.node == YAMLScalar::zero || cell.node == YAMLScalar::one;
  };
  return IsSwitch(row.path) && is_on_or_off(row.committed) &&
         std::ranges::all_of(kCells, [&](const auto cell) { return is_on_or_off(row.*cell); });
}

// What is the same in objects of one class; empty for a whole object.
std::string PropertyName(const ReportRow& row) {
  if (!row.overridden.empty()) return "override of " + row.overridden;
  return row.path.size() < 2 ? std::string() : PathToString({row.path.begin() + 1, row.path.end()});
}

Json RowJson(const ReportRow& row, VersionNames& names, bool shows_committed) {
  Json json = {{"key", Cleaned(PathToString(row.path))}};
  const std::string path = ChoicePath(row);
  if (!path.empty()) json["path"] = path;
  json["field"] = row.path.size() < 2 ? std::string() : Cleaned(row.path.back()->GetText());
  json["label"] = OnOneLine(row.overridden.empty() ? FieldLabel(row.path) : PropertyLabel(row.overridden));
  json["property"] = Cleaned(PropertyName(row));
  json["state"] = InWordsOfPeople(row.state);
  json["note"] = OnOneLine(row.note);
  json["pending"] = row.pending;
  json["repaired"] = row.repaired;
  const bool is_settled = row.state.starts_with(kSettled);
  json["choice"] = is_settled ? Json(InWordsOfPeople(row.state.substr(kSettled.size()))) : Json();
  const bool is_switch = IsSwitchRow(row);
  for (size_t i = 0; i < std::size(kCells); ++i) {
    json[std::string(kCellNames[i])] = CellJson(row.*kCells[i], is_switch, names.In(kCells[i]).own);
  }
  if (shows_committed)
    json["committed"] = CellJson(row.committed, is_switch, names.In(&ReportRow::committed).own);
  return json;
}

Json ObjectJson(const ReportObject& object, VersionNames& names, bool shows_committed) {
  Json rows = Json::array();
  for (const ReportRow& row : object.rows) rows.push_back(RowJson(row, names, shows_committed));
  const std::string script = names.Latest().GetScriptClass(names.Latest().GetScriptGuid(object.file_id));
  return {{"id", Cleaned(object.file_id->GetText())},
          {"class", OnOneLine(object.class_name)},
          {"script", OnOneLine(script)},
          {"title", OnOneLine(Readable(script.empty() ? object.class_name : script))},
          {"rows", std::move(rows)}};
}

Json Card(const ReportCard& card, VersionNames& names, bool shows_committed) {
  Json sides = Json::array();
  Json kinds = Json::array();
  Json objects = Json::array();
  size_t pending = 0;
  size_t settled = 0;
  for (const ReportObject& object : card.objects) {
    objects.push_back(ObjectJson(object, names, shows_committed));
    for (const ReportRow& row : object.rows) {
      pending += row.pending ? 1 : 0;
      settled += row.state.starts_with(kSettled) ? 1 : 0;
    }
  }
  const auto any = [&](bool ReportObject::*flag) {
    return std::ranges::any_of(card.objects, [&](const ReportObject& object) { return object.*flag; });
  };
  if (any(&ReportObject::left)) sides.push_back("theirs");
  if (any(&ReportObject::right)) sides.push_back("ours");
  if (pending > 0) kinds.push_back("conflict");
  if (settled > 0) kinds.push_back("settled");
  if (any(&ReportObject::added)) kinds.push_back("added");
  if (any(&ReportObject::changed)) kinds.push_back("changed");
  if (any(&ReportObject::removed)) kinds.push_back("removed");
  if (any(&ReportObject::repaired)) kinds.push_back("repaired");
  const std::string& name = !card.name.empty()         ? card.name
                            : !card.class_name.empty() ? card.class_name
                                                       : card.file_id->GetText();
  return {{"key", Cleaned(card.file_id->GetText())},
          {"name", OnOneLine(name)},
          {"path", OnOneLine(card.path)},
          {"class", OnOneLine(card.class_name)},
          {"sides", std::move(sides)},
          {"kinds", std::move(kinds)},
          {"pending", pending},
          {"objects", std::move(objects)}};
}

std::string Dump(const Json& json) { return json.dump(-1, ' ', false, Json::error_handler_t::replace); }

}  // namespace

std::string ChoicePath(const ReportRow& row) {
  const bool can_be_settled = row.pending || row.state.starts_with(kSettled);
  if (!can_be_settled) return {};
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string path;
  std::string_view rest = row.record_path;
  // What is no character any more would be another byte to whoever reads it.
  while (!rest.empty()) {
    size_t length = 1;
    const bool is_ascii = static_cast<unsigned char>(rest[0]) < 0x80;
    while (!is_ascii && length < rest.size() && (static_cast<unsigned char>(rest[length]) & 0xC0) == 0x80)
      ++length;
    const std::string_view character = rest.substr(0, length);
    rest.remove_prefix(length);
    if (Cleaned(character) == character) {
      path += character;
      continue;
    }
    for (const char byte : character) {
      const auto value = static_cast<unsigned char>(byte);
      path.append("\\x").append(1, kDigits[value >> 4]).append(1, kDigits[value & 15]);
    }
  }
  return path;
}

std::string CardJson(const ReportCard& card, VersionNames& names) { return Dump(Card(card, names, false)); }

std::string ReportJson(const MergedFiles& files, VersionNames& names, const std::string& title) {
  Json cards = Json::array();
  size_t pending = 0;
  for (const ReportCard& card : MakeCards(CollectReport(files, names, {"theirs", "ours"}), names.Latest())) {
    cards.push_back(Card(card, names, files.committed != nullptr));
    pending += cards.back()["pending"].get<size_t>();
  }
  Json notes = Json::array();
  for (const SceneNote& note : files.notes) notes.push_back(NamedNote(note.text, names.Latest()));
  return Dump({{"version", kReportJsonVersion},
               {"title", OnOneLine(title)},
               {"pending", pending},
               {"error", OnOneLine(files.error)},
               {"notes", std::move(notes)},
               {"cards", std::move(cards)}}) +
         '\n';
}

}  // namespace vexel_yaml
