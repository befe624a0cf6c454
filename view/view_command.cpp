#include "view/view_command.h"

#include <charconv>
#include <filesystem>
#include <iostream>
#include <new>
#include <string_view>
#include <system_error>

#include "platform/error_channel.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/temporary_files.h"
#include "report/value_text.h"
#include "rules/setup.h"
#include "view/finished_file.h"
#include "view/view_server.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kUsage =
    "usage: vexel-merge-view [options] <base> <left> <right> <merged>\n"
    "           merges the three files on a page in the browser, and writes the result to <merged>\n"
    "\n"
    "options: -i FILE                 settle conflicts as FILE says, to begin with\n"
    "         -o FILE                 write what was settled to FILE, too\n"
    "         --plain                 merge value by value, not scenes as scenes\n"
    "         --rules FILE            other merge rules than the default ones\n"
    "         --typeInfo FILE         check components, with the type information in FILE\n"
    "         --title TEXT            what the page calls the file\n"
    "         --theirs NAME           who or what is behind <left>; likewise --ours for <right>, and --base\n"
    "         --port N                the page's port, instead of a free one\n"
    "         --no-browser            print the page's address, but start no browser\n"
    "         --idle-timeout SECONDS  give up after so long without a sign of life (28800)\n"
    "         --version, --help\n"
    "\n"
    "status:  0 once the result is saved, 1 if it is not\n";

struct Arguments {
  std::string resolutions;
  std::string record;
  std::string rules = "auto";
  std::string type_info;
  std::string port;
  std::string idle_timeout;
  std::string merged;
  ViewFile file;
  ViewServerOptions server;
};

int Fail(const std::string& message) {
  WriteErrorLine(OnOneLine("vexel-merge-view: " + message));
  return 1;
}

// Where the value of an option goes, null for what is no option with a value.
std::string* ValueTarget(std::string_view option, Arguments& parsed) {
  if (option == "-i") return &parsed.resolutions;
  if (option == "-o") return &parsed.record;
  if (option == "--rules") return &parsed.rules;
  if (option == "--typeInfo") return &parsed.type_info;
  if (option == "--title") return &parsed.file.title;
  if (option == "--theirs") return &parsed.file.theirs_name;
  if (option == "--ours") return &parsed.file.ours_name;
  if (option == "--base") return &parsed.file.base_name;
  if (option == "--port") return &parsed.port;
  if (option == "--idle-timeout") return &parsed.idle_timeout;
  return nullptr;
}

// Leaves `number` alone where nothing was given.
void ParseNumber(const std::string& option, const std::string& text, int most, int& number) {
  if (text.empty()) return;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error == std::errc() && end == text.data() + text.size() && number >= 1 && number <= most) return;
  throw std::runtime_error(option + " takes a whole number from 1 to " + std::to_string(most) + ", not '" +
                           text + "'");
}

// Throws std::runtime_error for arguments that make no sense.
Arguments Parse(const std::vector<std::string>& arguments) {
  Arguments parsed;
  std::vector<std::string> paths;
  bool only_paths = false;
  for (size_t index = 0; index < arguments.size(); ++index) {
    const std::string& argument = arguments[index];
    if (only_paths || !argument.starts_with('-')) {
      paths.push_back(argument);
    } else if (argument == "--") {
      only_paths = true;
    } else if (argument == "--plain") {
      parsed.file.safe = false;
    } else if (argument == "--no-browser") {
      parsed.server.opens_browser = false;
    } else if (std::string* target = ValueTarget(argument, parsed)) {
      if (++index == arguments.size()) throw std::runtime_error("option " + argument + " needs a value");
      *target = arguments[index];
    } else {
      throw std::runtime_error("unknown option " + argument + "; see vexel-merge-view --help");
    }
  }
  if (paths.size() != 4) {
    throw std::runtime_error("needs 4 paths, not " + std::to_string(paths.size()) +
                             "; see vexel-merge-view --help");
  }
  parsed.file.base_path = paths[0];
  parsed.file.left_path = paths[1];
  parsed.file.right_path = paths[2];
  parsed.merged = paths[3];
  if (parsed.file.title.empty()) parsed.file.title = parsed.merged;
  ParseNumber("--port", parsed.port, 65535, parsed.server.port);
  ParseNumber("--idle-timeout", parsed.idle_timeout, 365 * 24 * 60 * 60, parsed.server.idle_seconds);
  return parsed;
}

// Whether both are one file, or would be.
bool AreSame(const std::string& path, const std::string& other) {
  const auto first = std::filesystem::absolute(FollowLinks(VexelToNativePath(path)));
  const auto second = std::filesystem::absolute(FollowLinks(VexelToNativePath(other)));
  std::error_code error;
  // A terminal, or what takes everything, can be both.
  if (std::filesystem::exists(first, error) && !std::filesystem::is_regular_file(first, error)) return false;
  return std::filesystem::equivalent(first, second, error) ||
         std::filesystem::weakly_canonical(first, error) == std::filesystem::weakly_canonical(second, error);
}

// Throws what speaks against writing to the destinations, so that nobody settles conflicts for nothing.
void CheckDestinations(const Arguments& arguments) {
  CheckDestination(arguments.merged);
  if (arguments.record.empty()) return;
  const ViewFile& file = arguments.file;
  for (const std::string& path : {file.base_path, file.left_path, file.right_path, arguments.merged}) {
    if (AreSame(arguments.record, path))
      throw std::runtime_error("the record (-o) would replace '" + path + "'");
  }
  CheckDestination(arguments.record);
}

int View(Arguments arguments) {
  const TempFilesGuard guard;
  TimerStat silent("", nullptr);
  CheckDestinations(arguments);
  SetupRulesAndTypes(arguments.rules, arguments.type_info, silent);
  if (!arguments.resolutions.empty()) arguments.file.resolutions = ReadResolutions(arguments.resolutions);
  arguments.file.store = [&](const std::string& text, const std::string& record) {
    StoreResult(arguments.merged, text, arguments.record, record);
  };
  ViewGuide guide;
  guide.when_saved = [] {
    return NextStep{"What opened this page, such as your version control, goes on by itself now."};
  };
  guide.when_given_up = {"Whatever opened this page opens it again."};
  const int status = RunViewServer({arguments.file}, arguments.server, std::move(guide));
  if (status != 0) WriteErrorLine(OnOneLine("Nothing is saved: " + arguments.merged + " is as it was"));
  return status;
}

}  // namespace

int RunView(const std::vector<std::string>& command_line) {
  initialize();
  const std::vector<std::string> arguments(command_line.begin() + (command_line.empty() ? 0 : 1),
                                           command_line.end());
  if (arguments == std::vector<std::string>{"--version"}) {
    std::cout << "vexel-merge-view " VEXEL_VERSION "\n";
    return 0;
  }
  if (arguments == std::vector<std::string>{"--help"}) {
    std::cout << kUsage;
    return 0;
  }
  try {
    return View(Parse(arguments));
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const YAMLError& error) {
    return Fail(Explained(error));
  } catch (const std::exception& error) {
    return Fail(Explained(error));
  }
}

}  // namespace vexel_yaml
