#include "git/git_command.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <iostream>
#include <string_view>

#include "git/check.h"
#include "git/merge_driver.h"
#include "git/mergetool.h"
#include "git/page_call.h"
#include "git/preview.h"
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
       vexel-merge-git resolve --web [--port <n>] [--no-browser] [--force] [--] [<file>...]
       vexel-merge-git resolve -p [--color=<when>] [--force] [--] [<file>...]
       vexel-merge-git resolve [--theirs | --ours | --base] [--path <pattern>] [--force] [--] <file>...
       vexel-merge-git resolve --as-is [--] <file>...
       vexel-merge-git check [--conflicts] [--staged | <commit> | [--] <file>...]
       vexel-merge-git preview <branch>
       vexel-merge-git report [-o <file>] [<merge commit>] [-- <path>...]
       vexel-merge-git review [--port <n>] [--no-browser] <from>[..<to>] [-- <path>...]
       vexel-merge-git --version | --help

  enable     set the merge driver, the diff driver, the merge tool and the attributes of this
             repository, or with --global those of all your repositories
  disable    undo that, and nothing else
  status     say what is set, and whether the programs are found
  resolve    merge conflicting files (of folders, all below) once more: with what you choose on a
             page in the browser (--web), or answer conflict by conflict (-p), with a side's
             values, or with what the records say; stage those in which nothing
             is left, or with --as-is, all as they stand
  check      say which conflicts nobody has settled, and which scenes are broken: of the conflicts
             at hand, in what is staged, or in a commit; status 1 where there are some
  preview    say what merging a branch would do, and who collides with whom; nothing is written
  report     write a page for each file that shows what both sides did and what came out:
             of the conflicts at hand, or of a merge commit
  review     show in the browser what changed between two commits, or since one, object by object

  Theirs (--left, too) is what is merged, ours (--right) is where you stand; in a rebase, theirs
  are your own commits. The record of a conflict lies beside the file, as <file>.vexel-conflicts.
)";

// What people call; git and the hook call the others.
constexpr std::array<std::string_view, 8> kCommands = {"enable", "disable", "status", "resolve",
                                                       "check",  "preview", "report", "review"};

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
  if (command == "sweep") return RunSweep(arguments);
  if (command == "check") return RunCheck(arguments);
  if (command == "preview") return RunPreview(arguments);
  if (command == "review") GoOnOnPage(command, arguments);
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
  return RunForGit(
      [&] { return RunCommand(command_line[1], Arguments(command_line.begin() + 2, command_line.end())); });
}

int RunForGit(const std::function<int()>& command) {
  initialize();
  // What these make of pathspecs is meant for the user's, and would undo what ours say.
  for (const char* variable :
       {"GIT_LITERAL_PATHSPECS", "GIT_GLOB_PATHSPECS", "GIT_NOGLOB_PATHSPECS", "GIT_ICASE_PATHSPECS"}) {
    unsetenv(variable);
  }
  // Git's own messages are all there is to read, also on a desktop.
  gHeadlessEnabled = true;
  const TempFilesGuard guard;
  try {
    return command();
  } catch (const CommandError& error) {
    if (*error.what() != '\0') Complain(error.what());
    return error.GetStatus();
  } catch (const FileError& error) {
    Complain(error.what());
    return 1;
  }
}

}  // namespace vexel_yaml
