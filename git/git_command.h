#pragma once

#include <functional>
#include <string>
#include <vector>

namespace vexel_yaml {

/// Runs the program `vexel-merge-git` with its command line, which begins with its own path. Returns its exit
/// status.
int RunGitCommand(const std::vector<std::string>& command_line);

/// Runs a command of this program with what all of them need. Returns its status, or that of what went wrong,
/// which has been said.
int RunForGit(const std::function<int()>& command);

}  // namespace vexel_yaml
