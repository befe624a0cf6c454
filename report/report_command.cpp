#include "report/report_command.h"

#include <algorithm>
#include <filesystem>
#include <iostream>
#include <new>
#include <optional>
#include <sstream>

#include "platform/error_channel.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/keep_until_exit.h"
#include "platform/read_whole_file.h"
#include "platform/temporary_files.h"
#include "report/conflict_list.h"
#include "report/merged_files.h"
#include "report/object_counts.h"
#include "report/readable_headers.h"
#include "report/report_json.h"
#include "report/value_text.h"
#include "report/version_names.h"
#include "report/write_page.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kUsage =
    "usage: vexel-merge-report [options] <base> <left> <right>\n"
    "           writes what a merge of the three files does as a page for the browser\n"
    "       vexel-merge-report --json [options] <base> <left> <right>\n"
    "           writes the same as JSON for other programs\n"
    "       vexel-merge-report --conflicts [options] <base> <left> <right>\n"
    "           prints one line a conflict: a pattern for its path, what left did, what right did, between "
    "tabs\n"
    "       vexel-merge-report --text <file>\n"
    "           prints a scene or prefab with the names of its objects in their header lines\n"
    "\n"
    "options: -o FILE         where the page goes (report.html), or the JSON; - for standard output\n"
    "         --title TEXT    the page's title\n"
    "         --theirs NAME   who or what is behind <left>; likewise --ours for <right>\n"
    "         -i FILE         settle conflicts as FILE says\n"
    "         --rules FILE    other merge rules than the default ones\n"
    "         --typeInfo FILE check components, with the type information in FILE\n"
    "         --assets FILE   the names of other assets: a line each, with the guid, a blank and the file's "
    "name\n"
    "         --committed FILE show beside the result what became of it in the end\n"
    "         --summary       print of the page how many objects were added, changed and removed, and how "
    "many "
    "conflicts are open\n"
    "         --safe          merge scenes as scenes, as VexelYAMLMerge merge --safe does\n"
    "         --version, --help\n";

enum class Mode { kPage, kJson, kConflicts, kText };

struct Arguments {
  Mode mode = Mode::kPage;
  std::string output;
  std::string title;
  bool prints_summary = false;
  bool names_sides = false;
  std::string theirs;
  std::string ours;
  ReportConfig config;
  std::string assets_file;
  AssetNames assets;
  std::string text_file;
};

int Fail(const std::string& message) {
  WriteErrorLine(OnOneLine("vexel-merge-report: " + message));
  return 1;
}

// Where the value of an option goes, null for what is no option with a value.
std::string* ValueTarget(std::string_view option, Arguments& parsed) {
  if (option == "-o") return &parsed.output;
  if (option == "--title") return &parsed.title;
  if (option == "--theirs") return &parsed.theirs;
  if (option == "--ours") return &parsed.ours;
  if (option == "-i") return &parsed.config.merge_file;
  if (option == "--committed") return &parsed.config.committed_path;
  if (option == "--rules") return &parsed.config.rules_file;
  if (option == "--typeInfo") return &parsed.config.type_info_file;
  if (option == "--assets") return &parsed.assets_file;
  return nullptr;
}

// Nobody has chosen this name, so a repository could have a link there that leads to a file of the user's.
std::string DefaultPage() {
  std::string page = "report.html";
  std::error_code error;
  if (!std::filesystem::is_symlink(page, error)) return page;
  throw std::runtime_error(page + " is a symbolic link; say -o " + page + " to write where it leads to");
}

// Throws std::runtime_error for arguments that make no sense.
Arguments Parse(const std::vector<std::string>& arguments) {
  Arguments parsed;
  std::vector<std::string> given;
  bool only_paths = false;
  for (size_t index = 0; index < arguments.size(); ++index) {
    const std::string& argument = arguments[index];
    if (only_paths || !argument.starts_with('-')) {
      given.push_back(argument);
    } else if (argument == "--") {
      only_paths = true;
    } else if (argument == "--conflicts") {
      parsed.mode = Mode::kConflicts;
    } else if (argument == "--json") {
      parsed.mode = Mode::kJson;
    } else if (argument == "--text") {
      parsed.mode = Mode::kText;
    } else if (argument == "--summary") {
      parsed.prints_summary = true;
    } else if (argument == "--safe") {
      parsed.config.safe = true;
    } else if (std::string* target = ValueTarget(argument, parsed)) {
      if (++index == arguments.size()) throw std::runtime_error("option " + argument + " needs a value");
      *target = arguments[index];
      parsed.names_sides |= argument == "--theirs" || argument == "--ours";
    } else {
      throw std::runtime_error("unknown option " + argument + "; see vexel-merge-report --help");
    }
  }
  ReportConfig& config = parsed.config;
  std::vector<std::string*> paths = {&config.base_path, &config.left_path, &config.right_path};
  if (parsed.mode == Mode::kText) paths = {&parsed.text_file};
  if (given.size() != paths.size()) {
    throw std::runtime_error("needs " + std::to_string(paths.size()) +
                             (paths.size() == 1 ? " path" : " paths") + ", not " +
                             std::to_string(given.size()) + "; see vexel-merge-report --help");
  }
  for (size_t i = 0; i < paths.size(); ++i) *paths[i] = given[i];
  if (parsed.mode == Mode::kPage && parsed.output.empty()) parsed.output = DefaultPage();
  if (parsed.mode == Mode::kJson && parsed.output.empty()) parsed.output = "-";
  if (parsed.prints_summary && (parsed.mode != Mode::kPage || parsed.output == "-"))
    throw std::runtime_error("--summary goes with a page in a file; see vexel-merge-report --help");
  return parsed;
}

// Throws FileError, and std::runtime_error where there is no such file.
AssetNames ReadAssetNames(const std::string& path) {
  if (path.empty()) return {};
  const std::optional<std::string> text = ReadWholeFile(VexelToNativePath(path));
  if (!text) throw std::runtime_error("Cannot open file '" + path + "'");
  AssetNames names;
  std::istringstream lines(*text);
  for (std::string line; std::getline(lines, line);) {
    const size_t blank = std::min(line.find(' '), line.size());
    names.emplace(line.substr(0, blank), line.substr(std::min(blank + 1, line.size())));
  }
  return names;
}

int PrintText(const std::string& path) {
  try {
    const std::optional<std::string> text = ReadWholeFile(VexelToNativePath(path));
    if (!text) return Fail("Cannot open file '" + path + "'");
    WriteWithReadableHeaders(std::cout, *text);
  } catch (const FileError& error) {
    return Fail(error.what());
  }
  return 0;
}

void PrintConflicts(const RecordingConflictResolver& resolver) {
  for (const ListedConflict& conflict : ListConflicts(resolver)) {
    std::cout << conflict.place << '\t' << conflict.left << '\t' << conflict.right << '\n';
  }
}

void WriteReport(const Arguments& arguments, const MergedFiles& files, std::ostream& out) {
  const ReportConfig& config = arguments.config;
  VersionNames names = NamesOf(files);
  names.SetAssetNames(arguments.assets);
  const std::string title = arguments.title.empty() ? "Merge report" : arguments.title;
  if (arguments.mode == Mode::kJson) {
    out << ReportJson(files, names, title);
    return;
  }
  const PageHead head = {title,
                         config.base_path,
                         config.left_path,
                         config.right_path,
                         files.error,
                         files.committed != nullptr,
                         arguments.names_sides,
                         OnOneLine(arguments.theirs),
                         OnOneLine(arguments.ours)};
  SideWords words;
  if (arguments.names_sides)
    words = {head.theirs_name.empty() ? "Their side" : head.theirs_name,
             head.ours_name.empty() ? "Our side" : head.ours_name};
  std::vector<ReportObject> objects = CollectReport(files, names, words);
  WritePage(out, head, objects);
  if (!arguments.prints_summary) return;
  const ObjectCounts counts = CountObjects(MakeCards(std::move(objects), names.Latest()));
  std::cout << counts.added << '\t' << counts.changed << '\t' << counts.removed << '\t' << counts.pending
            << '\n';
}

void WriteReportFile(const Arguments& arguments, const MergedFiles& files) {
  if (arguments.output == "-") {
    WriteReport(arguments, files, std::cout);
    return;
  }
  const TempFilesGuard guard;
  FileReplacement file(VexelToNativePath(arguments.output));
  WriteReport(arguments, files, file.Stream());
  file.Commit();
}

int Report(const Arguments& arguments) {
  MergedFiles& files = KeepUntilExit(std::make_unique<MergedFiles>());
  const std::string prefix = "Cannot merge file '" + arguments.config.base_path + "': ";
  try {
    MergeForReport(arguments.config, files);
    if (arguments.mode == Mode::kPage || arguments.mode == Mode::kJson) {
      WriteReportFile(arguments, files);
      return 0;
    }
    if (!files.error.empty()) return Fail(prefix + files.error);
    PrintConflicts(files.resolver);
  } catch (const std::bad_alloc&) {
    // No matter of these files.
    throw;
  } catch (const FileError& error) {
    return Fail(error.what());
  } catch (const YAMLError& error) {
    return Fail(prefix + Explained(error));
  } catch (const std::exception& error) {
    return Fail(prefix + Explained(error));
  }
  return 0;
}

}  // namespace

int RunReport(const std::vector<std::string>& command_line) {
  initialize();
  const int skipped = command_line.empty() ? 0 : 1;
  const std::vector<std::string> arguments(command_line.begin() + skipped, command_line.end());
  if (arguments.size() == 1 && arguments.front() == "--version") {
    std::cout << "vexel-merge-report " VEXEL_VERSION "\n";
    return 0;
  }
  if (arguments.size() == 1 && arguments.front() == "--help") {
    std::cout << kUsage;
    return 0;
  }
  Arguments parsed;
  try {
    parsed = Parse(arguments);
    parsed.assets = ReadAssetNames(parsed.assets_file);
  } catch (const std::exception& error) {
    return Fail(error.what());
  }
  return parsed.mode == Mode::kText ? PrintText(parsed.text_file) : Report(parsed);
}

}  // namespace vexel_yaml
