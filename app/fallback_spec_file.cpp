#include "app/fallback_spec_file.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <optional>
#include <sstream>
#include <string_view>
#include <system_error>

#include "app/command_line.h"
#include "platform/error_channel.h"
#include "platform/file_error.h"
#include "platform/files.h"
#include "platform/read_whole_file.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kSpecFileName = "mergespecfile.txt";
constexpr std::string_view kAnyExtension = "*";
constexpr std::string_view kProgramsPlaceholder = "%programs%";
constexpr std::string_view kApplications = "/Applications";
constexpr std::string_view kBlanks = " \t";
// The place in the list is the entry's mode.
constexpr std::array<std::string_view, 3> kModes = {"use", "use-on-conflict", "use-second-pass"};

std::string_view SkipBlanks(std::string_view text) {
  text.remove_prefix(std::min(text.find_first_not_of(kBlanks), text.size()));
  return text;
}

// Cuts the text before the first of `delimiters` off `text`, which loses that delimiter too.
std::string_view CutUpTo(std::string_view delimiters, std::string_view& text) {
  const std::string_view part = text.substr(0, text.find_first_of(delimiters));
  text.remove_prefix(std::min(part.size() + 1, text.size()));
  return part;
}

std::string ReplacePrograms(std::string text, const std::string& folder) {
  for (size_t at = 0; (at = text.find(kProgramsPlaceholder, at)) != std::string::npos; at += folder.size()) {
    text.replace(at, kProgramsPlaceholder.size(), folder);
  }
  return text;
}

// False, with the error reported, where the line's mode doesn't exist.
bool AddLine(std::string_view line, int line_number, FallbackCommandMap& map) {
  const std::string extension(CutUpTo(kBlanks, line));
  line = SkipBlanks(line);
  const std::string_view mode_text = CutUpTo(kBlanks, line);
  const auto mode = std::ranges::find(kModes, mode_text);
  if (mode == kModes.end()) {
    errs << "Unknown mode '" << mode_text << "' on line " << line_number << '\n';
    ErrMsg(errs);
    return false;
  }
  CutUpTo("\"", line);
  FallbackCommandEntry entry;
  entry.mode = static_cast<int>(mode - kModes.begin());
  // Without both quotes there is no tool, and the look-up passes over the entry.
  if (line.find('"') != std::string_view::npos) entry.tool = CutUpTo("\"", line);
  entry.arguments = SkipBlanks(line);

  std::vector<FallbackCommandEntry>& entries = map[extension];
  if (entry.tool.find(kProgramsPlaceholder) == std::string::npos) {
    entries.push_back(entry);
    return true;
  }
  for (const std::string& home : {std::string(), GetUserHomeDir()}) {
    entries.push_back(entry);
    entries.back().tool = ReplacePrograms(entry.tool, home + std::string(kApplications));
  }
  return true;
}

bool AddLines(const std::string& text, FallbackCommandMap& map) {
  std::istringstream stream(text);
  std::string line;
  for (int line_number = 1; std::getline(stream, line); ++line_number) {
    // From a file that was written on Windows; the shell would take it for a part of the last argument.
    if (line.ends_with('\r')) line.pop_back();
    if (line.empty() || line.front() == '#') continue;
    if (!AddLine(line, line_number, map)) return false;
  }
  return true;
}

const FallbackCommandEntry* FindExistingTool(const FallbackCommandMap& map, const std::string& extension) {
  const auto entries = map.find(extension);
  if (entries == map.end()) return nullptr;
  const auto entry = std::ranges::find_if(entries->second, FileExists, &FallbackCommandEntry::tool);
  return entry == entries->second.end() ? nullptr : &*entry;
}

}  // namespace

std::string GetSpecFilename(const std::string& spec) {
  if (spec != kDefaultSpecFile) return spec;
  const std::string own = GetUserHomeDir() + "/." + std::string(kSpecFileName);
  return FileExists(own) ? own : GetDataFilePath(std::string(kSpecFileName));
}

bool PopulateFallbacks(FallbackCommandMap& map, const std::string& path) {
  std::string reason;
  try {
    const std::optional<std::string> text = ReadWholeFile(path);
    if (text && AddLines(*text, map)) return true;
    if (!text) reason = std::generic_category().message(errno);
  } catch (const FileError& error) {
    reason = error.what();
  }
  errs << "Couldn't load spec file '" << path << "'\n";
  ErrMsg(errs);
  WriteHint(reason);
  return false;
}

FallbackCommandEntry GetFallbackCommandEntry(const FallbackCommandMap& map, const std::string& path,
                                             const std::string& spec_file) {
  const std::string extension = GetFileExtension(path);
  for (const std::string& key : {extension, std::string(kAnyExtension)}) {
    if (const FallbackCommandEntry* entry = FindExistingTool(map, key)) return *entry;
  }
  errs << "Couldn't locate merge tool to handle extension " << extension << " in " << spec_file << '\n';
  ErrMsg(errs);
  return {};
}

}  // namespace vexel_yaml
