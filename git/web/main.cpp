#include "git/git_command.h"
#include "git/web/web_command.h"
#include "platform/run_main.h"
#include "view/view_command.h"

namespace {

// The program is called by people and version controls, or by vexel-merge-git.
int Run(const std::vector<std::string>& command_line) {
  if (command_line.size() < 2 || command_line[1] != "--git") return vexel_yaml::RunView(command_line);
  const std::vector<std::string> arguments(command_line.begin() + 2, command_line.end());
  return vexel_yaml::RunForGit([&] { return vexel_yaml::RunOnPage(arguments); });
}

}  // namespace

int main(int argc, char** argv) { return vexel_yaml::RunMain(argc, argv, Run); }
