#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Runs the program `vexel-merge-git` with its command line, which begins with its own path. Returns its exit
/// status.
int RunGitCommand(const std::vector<std::string>& command_line);

}  // namespace vexel_yaml
