#include <algorithm>
#include <optional>
#include <sstream>
#include <string>

#include "merge/conflict_record_file.h"
#include "platform/files.h"
#include "platform/read_whole_file.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

bool Contains(std::string_view line, std::string_view text) {
  return line.find(text) != std::string_view::npos;
}

std::optional<MergeResolve> HandlingOf(std::string_view word) {
  std::string lower(word);
  std::transform(lower.begin(), lower.end(), lower.begin(),
                 [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; });
  if (lower == "left") return MergeResolve::kLeft;
  if (lower == "right") return MergeResolve::kRight;
  if (lower == "base") return MergeResolve::kBase;
  // "breakCycle" is no resolution that can be read back: a cycle is always broken.
  return std::nullopt;
}

// One line of the handling section; nothing for a line that is skipped.
std::optional<RecordingConflictResolver::RecordResolve> ParseHandling(std::string_view line, int number) {
  const std::string place = std::to_string(number);
  const size_t blank = line.find(' ');
  if (blank == std::string_view::npos) {
    throw YAMLError("No handling type (left,right,base) specified on line " + place);
  }
  const std::string_view word = line.substr(0, blank);
  const std::optional<MergeResolve> handling = HandlingOf(word);
  if (!handling) {
    if (line.front() == '>') return std::nullopt;
    throw YAMLError("Unknown handling type '" + std::string(word) +
                    "' (should be left,right or base) specified on line " + place);
  }
  const size_t begin = line.find_first_not_of(' ', blank);
  if (begin == std::string_view::npos) throw YAMLError("No property path specified on line " + place);
  const std::string_view path = line.substr(begin, line.find(' ', begin) - begin);
  return RecordingConflictResolver::RecordResolve{StringToPath(path), *handling};
}

enum class Section { kNone, kConflicts, kHandling, kNonConflicts };

// Whether the program itself writes lines that begin so in a section that holds what came out of a merge.
// Keys and values stand there, and one that holds the text of a header must not begin a section: whoever
// edits a scene would decide conflicts in other people's merges.
bool IsRecordLine(std::string_view line, Section section) {
  constexpr std::string_view kOfConflicts[] = {" ", "Left ", "Right ", "BreakCycle "};
  constexpr std::string_view kOfNonConflicts[] = {"Both ", "none ", "Transform cycle ", "<unknown "};
  const auto begins = [&](std::string_view start) { return line.starts_with(start); };
  if (section != Section::kConflicts && section != Section::kNonConflicts) return false;
  return std::ranges::any_of(kOfConflicts, begins) ||
         (section == Section::kNonConflicts && std::ranges::any_of(kOfNonConflicts, begins));
}

// The section that a line of `section` begins, if it is a header.
std::optional<Section> SectionBegunBy(std::string_view line, Section section) {
  if (IsRecordLine(line, section)) return std::nullopt;
  if (Contains(line, "Conflicts:")) return Section::kConflicts;
  if (Contains(line, "Conflict handling:")) return Section::kHandling;
  if (Contains(line, "Non-conflicts:")) return Section::kNonConflicts;
  return std::nullopt;
}

}  // namespace

FieldPath StringToPath(std::string_view text) {
  FieldPath path;
  for (size_t begin = 0;;) {
    const size_t dot = text.find('.', begin);
    path.push_back(YAMLScalar::Lookup(text.substr(begin, dot - begin)));
    if (dot == std::string_view::npos) return path;
    begin = dot + 1;
  }
}

void InputConflictRecords(std::istream& in, RecordingConflictResolver& resolver) {
  std::vector<RecordingConflictResolver::RecordResolve> resolutions;
  Section section = Section::kNone;
  std::string line;
  for (int number = 1; std::getline(in, line); ++number) {
    // An editor may have given the file other line ends.
    if (!line.empty() && line.back() == '\r') line.pop_back();
    if (line.empty() || line.front() == '#') continue;
    if (const std::optional<Section> begun = SectionBegunBy(line, section)) {
      section = *begun;
    } else if (section == Section::kHandling) {
      if (auto resolution = ParseHandling(line, number)) resolutions.push_back(std::move(*resolution));
    }
  }
  resolver.SetResolveMethodForPaths(std::move(resolutions));
}

bool InputConflictRecords(const std::string& path, RecordingConflictResolver& resolver) {
  const std::optional<std::string> text = ReadWholeFile(VexelToNativePath(path));
  if (!text) return false;
  std::istringstream stream(*text);
  try {
    InputConflictRecords(stream, resolver);
  } catch (const YAMLError& error) {
    throw YAMLError(error.what(), "in merge resolve file '" + path + "'");
  }
  return true;
}

}  // namespace vexel_yaml
