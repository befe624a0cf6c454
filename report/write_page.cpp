#include "report/write_page.h"

#include <algorithm>
#include <optional>

#include "report/page_files.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

constexpr size_t kMostLines = 6;
constexpr size_t kMostOfLabel = 200;

struct Escaped {
  std::string_view text;
};

std::ostream& operator<<(std::ostream& out, const Escaped& escaped) {
  for (const char c : Cleaned(escaped.text)) {
    switch (c) {
      case '&':
        out << "&amp;";
        break;
      case '<':
        out << "&lt;";
        break;
      case '>':
        out << "&gt;";
        break;
      case '"':
        out << "&quot;";
        break;
      case '\'':
        out << "&#39;";
        break;
      default:
        out << c;
    }
  }
  return out;
}

std::string_view KindWord(ReportCell::Kind kind) {
  switch (kind) {
    case ReportCell::Kind::kAdded:
      return "added";
    case ReportCell::Kind::kRemoved:
      return "removed";
    case ReportCell::Kind::kUnchanged:
    case ReportCell::Kind::kChanged:
    case ReportCell::Kind::kEdited:
      break;
  }
  return {};
}

std::string Capital(std::string_view word) {
  return static_cast<char>(word.front() - 'a' + 'A') + std::string(word.substr(1));
}

// The first lines of a text of many lines.
std::string_view FirstLines(std::string_view text) {
  size_t end = 0;
  for (size_t line = 0; line < kMostLines; ++line) {
    end = text.find('\n', end);
    if (end == std::string_view::npos) return text;
    ++end;
  }
  return text.substr(0, end - 1);
}

void WriteText(std::ostream& out, const ReportCell& cell) {
  const std::string& text = cell.ForPeople();
  const std::string_view start = FirstLines(text);
  const bool is_whole_list = cell.kind != ReportCell::Kind::kEdited && !cell.shown.empty() &&
                             cell.node != nullptr && cell.node->AsSequence() != nullptr;
  const std::string_view more = is_whole_list ? std::string_view() : cell.full;
  const std::string_view full = start.size() < text.size() ? text : more;
  if (full.empty()) {
    out << "<span class=\"value\">" << Escaped{text} << "</span>";
    return;
  }
  out << "<details><summary><span class=\"value\">" << Escaped{start} << "</span></summary><pre>"
      << Escaped{full} << "</pre></details>";
}

void WriteCell(std::ostream& out, std::string_view name, const ReportCell& cell) {
  const bool unchanged = cell.kind == ReportCell::Kind::kUnchanged;
  out << "<td class=\"" << name << (unchanged ? " unchanged" : "") << "\">";
  const std::string_view word = KindWord(cell.kind);
  if (!word.empty()) out << "<b class=\"" << word << "\">" << word << "</b> ";
  if (!cell.text.empty()) {
    WriteText(out, cell);
  } else if (unchanged && name != "base") {
    out << "<span class=\"none\">" << (name == "result" || name == "committed" ? "not there" : "unchanged")
        << "</span>";
  }
  out << "</td>";
}

std::string FieldLabel(const ReportRow& row) {
  if (row.path.size() == 1) return "whole object";
  if (row.path.back() == YAMLScalar::classIDPlaceHolderName) return "class ID";
  if (row.path.back() == YAMLScalar::fileIDPlaceHolderName) return "file ID";
  if (row.path.back() == YAMLScalar::strippedPrefabPlaceHolderName) return "stripped mark";
  return Shortened(PathToString({row.path.begin() + (row.path.size() == 2 ? 1 : 2), row.path.end()}),
                   kMostOfLabel);
}

std::string_view RowClass(const ReportRow& row) {
  if (row.pending) return " class=\"conflict\"";
  return row.repaired ? " class=\"repaired\"" : "";
}

// The pattern as it stands in record files, with places for line breaks behind its dots.
void WriteRecordPath(std::ostream& out, std::string_view path) {
  out << "<code>";
  for (size_t dot = path.find('.'); dot != std::string_view::npos; dot = path.find('.')) {
    out << Escaped{path.substr(0, dot + 1)} << "<wbr>";
    path.remove_prefix(dot + 1);
  }
  out << Escaped{path} << "</code>";
}

std::string StateWords(const PageHead& head, std::string_view state) {
  return head.are_theirs_and_ours ? InWordsOfPeople(state) : std::string(state);
}

void WriteRow(std::ostream& out, const PageHead& head, const ReportRow& row) {
  out << "<tr data-path=\"" << Escaped{PathToString({row.path.begin() + 1, row.path.end()})} << "\""
      << RowClass(row) << "><th scope=\"row\">" << Escaped{FieldLabel(row)};
  if (!row.note.empty()) out << "<small>" << Escaped{row.note} << "</small>";
  out << "</th>";
  WriteCell(out, "base", row.base);
  WriteCell(out, "left", row.left);
  WriteCell(out, "right", row.right);
  WriteCell(out, "result", row.result);
  if (head.shows_committed) WriteCell(out, "committed", row.committed);
  out << "<td class=\"state\">";
  if (!row.state.empty()) out << "<span>" << StateWords(head, row.state) << "</span>";
  if (row.repaired && row.state != "repaired") out << " <span>repaired</span>";
  // Once it is committed, nobody settles it any more.
  if (row.pending && !head.shows_committed) WriteRecordPath(out, row.record_path);
  out << "</td></tr>\n";
}

struct Kind {
  std::string_view name;
  std::string_view label;
  bool ReportObject::*flag;
};

constexpr Kind kKinds[] = {{"conflict", "conflicts", &ReportObject::pending},
                           {"added", "added", &ReportObject::added},
                           {"changed", "changed", &ReportObject::changed},
                           {"removed", "removed", &ReportObject::removed},
                           {"repaired", "repaired", &ReportObject::repaired}};

struct Side {
  std::string_view name;
  std::string_view label;
  std::string_view word;
  std::string PageHead::*owner;
  bool ReportObject::*flag;
  ReportCell ReportRow::*cell;
};

constexpr Side kLeft = {
    "left", "Left (theirs)", "theirs", &PageHead::theirs_name, &ReportObject::left, &ReportRow::left};
constexpr Side kRight = {"right",          "Right (mine)", "ours", &PageHead::ours_name, &ReportObject::right,
                         &ReportRow::right};

void WriteSideHead(std::ostream& out, const PageHead& head, const Side& side) {
  const std::string& owner = head.*side.owner;
  out << "<th class=\"" << side.name << "\">";
  if (!head.are_theirs_and_ours) {
    out << Capital(side.name);
  } else if (owner.empty()) {
    out << Capital(side.word);
  } else {
    out << Escaped{owner} << "<small>" << side.word << "</small>";
  }
  out << "</th>";
}

void WriteObject(std::ostream& out, const PageHead& head, const ReportObject& object) {
  const Escaped file_id{object.file_id->GetText()};
  out << "<section class=\"object\" data-file-id=\"" << file_id << "\" data-sides=\""
      << (object.left ? "left" : "") << (object.left && object.right ? " " : "")
      << (object.right ? "right" : "") << "\" data-kinds=\"";
  std::string_view separator;
  for (const Kind& kind : kKinds) {
    if (!(object.*kind.flag)) continue;
    out << separator << kind.name;
    separator = " ";
  }
  out << "\">\n<h2><span class=\"name\">" << Escaped{object.path.empty() ? object.class_name : object.path}
      << "</span> ";
  if (!object.path.empty()) out << "<span class=\"class\">" << Escaped{object.class_name} << "</span> ";
  out << "<code>" << file_id << "</code>";
  for (const Kind& kind : kKinds) {
    if (object.*kind.flag) out << " <span class=\"badge " << kind.name << "\">" << kind.name << "</span>";
  }
  out << "</h2>\n<table><thead><tr><th>Field</th><th>Base</th>";
  WriteSideHead(out, head, kLeft);
  WriteSideHead(out, head, kRight);
  out << "<th>Result</th>" << (head.shows_committed ? "<th>Committed</th>" : "")
      << "<th>State</th></tr></thead><tbody>\n";
  for (const ReportRow& row : object.rows) WriteRow(out, head, row);
  out << "</tbody></table></section>\n";
}

// What a side did to an object as a whole, and whether it did anything.
std::optional<ReportCell::Kind> WholeChange(const ReportObject& object, const Side& side) {
  if (!(object.*side.flag)) return std::nullopt;
  const auto whole = std::ranges::find(object.rows, 1U, [](const ReportRow& row) { return row.path.size(); });
  const bool came_or_went =
      whole != object.rows.end() && ((*whole).*side.cell).kind > ReportCell::Kind::kEdited;
  return came_or_went ? ((*whole).*side.cell).kind : ReportCell::Kind::kChanged;
}

size_t CountRows(const std::vector<ReportObject>& objects, auto matches) {
  size_t count = 0;
  for (const ReportObject& object : objects) {
    count += static_cast<size_t>(std::ranges::count_if(object.rows, matches));
  }
  return count;
}

void WriteSideSummary(std::ostream& out, const PageHead& head, const Side& side, const std::string& path,
                      const std::vector<ReportObject>& objects) {
  const std::string owner = (head.*side.owner).empty() ? "" : " (" + head.*side.owner + ")";
  const std::string label = head.are_theirs_and_ours ? Capital(side.word) + owner : std::string(side.label);
  out << "<tr class=\"" << side.name << "\"><th scope=\"row\">" << Escaped{label}
      << "</th><td class=\"path\">" << Escaped{path} << "</td>";
  for (const auto kind : {ReportCell::Kind::kAdded, ReportCell::Kind::kChanged, ReportCell::Kind::kRemoved}) {
    const auto count = std::ranges::count_if(
        objects, [&](const ReportObject& object) { return WholeChange(object, side) == kind; });
    out << "<td class=\"number\">" << count << "</td>";
  }
  out << "</tr>\n";
}

void WriteState(std::ostream& out, std::string_view word, std::string_view css_class, size_t count) {
  if (count > 0) out << "<li class=\"" << css_class << "\"><b>" << count << "</b> " << word << "</li>\n";
}

void WriteSummary(std::ostream& out, const PageHead& head, const std::vector<ReportObject>& objects) {
  out << "<table class=\"summary\"><caption>Objects that each side touched</caption><thead><tr><th "
         "scope=\"col\">"
         "Version</th><th scope=\"col\">File</th><th scope=\"col\">added</th><th "
         "scope=\"col\">changed</th><th "
         "scope=\"col\">removed</th></tr></thead><tbody>\n<tr class=\"base\"><th scope=\"row\">Base</th><td "
         "class=\"path\">"
      << Escaped{head.base_path} << "</td><td></td><td></td><td></td></tr>\n";
  WriteSideSummary(out, head, kLeft, head.left_path, objects);
  WriteSideSummary(out, head, kRight, head.right_path, objects);
  out << "</tbody></table>\n<ul class=\"states\" aria-label=\"Changes by state\">\n";
  const size_t pending = CountRows(objects, [](const ReportRow& row) { return row.pending; });
  const std::string word = pending == 1 ? "conflict" : "conflicts";
  WriteState(out, word + (head.shows_committed ? " in the merge" : " to settle"), "conflict", pending);
  WriteState(out, "settled", "",
             CountRows(objects, [](const ReportRow& row) { return row.state.starts_with("settled"); }));
  WriteState(out, "repaired", "repaired",
             CountRows(objects, [](const ReportRow& row) { return row.repaired; }));
  for (const std::string_view state : {"from left", "from right", "same on both", "merged", "not taken"}) {
    WriteState(out, StateWords(head, state),
               state == "from left"    ? "left"
               : state == "from right" ? "right"
                                       : "",
               CountRows(objects, [&](const ReportRow& row) { return row.state == state; }));
  }
  out << "</ul>\n";
}

// Hidden until the script has made the controls work.
void WriteFilters(std::ostream& out, const PageHead& head, size_t object_count) {
  out << "<form id=\"filters\" aria-label=\"Filters\" hidden>\n<label>Side <select id=\"side\"><option "
         "value=\"all\">all</option><option "
         "value=\"left\">"
      << StateWords(head, kLeft.name) << "</option><option value=\"right\">" << StateWords(head, kRight.name)
      << "</option><option value=\"both\">both</option></select></label>\n<fieldset><legend>Only</legend>";
  for (const Kind& kind : kKinds) {
    out << "<label class=\"" << kind.name << "\"><input type=\"checkbox\" name=\"kind\" value=\"" << kind.name
        << "\"> " << kind.label << "</label>";
  }
  out << "</fieldset>\n<label class=\"search\">Find <input type=\"search\" id=\"text\" placeholder=\"name, "
         "ID, field "
         "or value ( / )\" autocomplete=\"off\" spellcheck=\"false\"></label>\n<button "
         "type=\"reset\">Reset</button>\n<output id=\"shown\">"
      << object_count << " of " << object_count << " objects</output>\n</form>\n";
}

}  // namespace

void WritePage(std::ostream& out, const PageHead& head, const std::vector<ReportObject>& objects) {
  out << "<!DOCTYPE html>\n<html lang=\"en\">\n<head>\n<meta charset=\"utf-8\">\n"
         "<meta http-equiv=\"Content-Security-Policy\" content=\"default-src 'none'; style-src '"
      << kPageStyleHash << "'; script-src '" << kPageScriptHash
      << "'; base-uri 'none'; form-action 'none'\">\n"
         "<meta name=\"viewport\" content=\"width=device-width, initial-scale=1\">\n"
         "<meta name=\"color-scheme\" content=\"light dark\">\n<title>"
      << Escaped{head.title} << "</title>\n<style>" << kPageStyle
      << "</style>\n</head>\n<body>\n<header>\n<h1>" << Escaped{head.title} << "</h1>\n";
  if (!head.error.empty()) {
    out << "<p class=\"banner\" role=\"alert\"><strong>The merge failed:</strong> " << Escaped{head.error}
        << ". Below is what both sides did; there is no result.</p>\n";
  }
  WriteSummary(out, head, objects);
  out << "</header>\n";
  if (!objects.empty()) WriteFilters(out, head, objects.size());
  out << "<main class=\"" << (head.are_theirs_and_ours ? "named " : "")
      << (head.shows_committed ? "with-committed" : "") << "\">\n";
  for (const ReportObject& object : objects) WriteObject(out, head, object);
  if (objects.empty()) {
    out << "<p class=\"empty\">Nothing changed.</p>\n";
  } else {
    out << "<p class=\"empty\" id=\"nothing\" hidden>Nothing matches the filters.</p>\n";
  }
  out << "</main>\n<script>" << kPageScript << "</script>\n</body>\n</html>\n";
}

}  // namespace vexel_yaml
