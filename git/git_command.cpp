#include "git/git_command.h"

#include <algorithm>
#include <array>
#include <iostream>
#include <string_view>

#include "git/merge_driver.h"
#include "git/report_pages.h"
#include "git/resolve.h"
#include "git/setup.h"
#include "git/shown_text.h"
#include "platform/error_channel.h"
#include "platform/file_error.h"
#include "platform/temporary_files.h"
#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

namespace {

using Arguments = std::vector<std::string>;

constexpr std::string_view kUsage =
    R"(usage: vexel-merge-git enable [--global] [--patterns '*.vexel *.prefab *.meta']
       vexel-merge-git disable [--global]
       vexel-merge-git status
       vexel-merge-git resolve [--left | --right | --base] [--path <pattern>] [--force] [--] <file>...
       vexel-merge-git report [-o <file>] [<merge commit>] [-- <path>...]
       vexel-merge-git --version | --help

  enable     set the merge driver, the diff driver, the merge tool and the attributes of this
             repository, or with --global those of all your repositories
  disable    undo that, and nothing else
  status     say what is set, and whether the programs are found
  resolve    merge conflicting files (of folders, all below) once more, with what their records say
             or, where a side is named, with that side's values; stage those in which nothing is left
  report     write a page for each file that shows what both sides did and what came out:
             of the conflicts at hand, or of a merge commit

  Left is "theirs", right is "ours". The record of a conflict lies beside the file, as
  <file>.vexel-conflicts.
)";

// What people call; git and the hook call the others.
constexpr std::array<std::string_view, 5> kCommands = {"enable", "disable", "status", "resolve", "report"};

int RunCommand(const std::string& command, const Arguments& arguments) {
  const bool is_for_people = std::ranges::find(kCommands, command) != kCommands.end();
  const bool asks_for_help =
      is_for_people && !arguments.empty() && (arguments.front() == "-h" || arguments.front() == "--help");
  if (command == "-h" || command == "--help" || asks_for_help) {
    std::cout << kUsage;
    return 0;
  }
  if (command == "--version") {
    std::cout << "vexel-merge-git " VEXEL_VERSION "\n";
    return 0;
  }
  if (command == "merge-driver") return RunMergeDriver(arguments);
  if (command == "textconv") return RunTextconv(arguments);
  if (command == "mergetool") return RunMergetool(arguments);
  if (command == "resolve") return RunResolve(arguments);
  if (command == "sweep") return RunSweep();
  if (command == "report") return RunReportPages(arguments);
  if (command == "enable") return RunEnable(arguments);
  if (command == "disable") return RunDisable(arguments);
  if (command == "status") return RunStatus(arguments);
  throw WrongUsage("unknown command '" + command + "'");
}

}  // namespace

int RunGitCommand(const Arguments& command_line) {
  if (command_line.size() < 2) {
    std::cerr << kUsage;
    return kWrongUsage;
  }
  initialize();
  // Git's own messages are all there is to read, also on a desktop.
  gHeadlessEnabled = true;
  const TempFilesGuard guard;
  try {
    return RunCommand(command_line[1], Arguments(command_line.begin() + 2, command_line.end()));
  } catch (const CommandError& error) {
    if (*error.what() != '\0') Complain(error.what());
    return error.GetStatus();
  } catch (const FileError& error) {
    Complain(error.what());
    return 1;
  }
}

}  // namespace vexel_yaml
