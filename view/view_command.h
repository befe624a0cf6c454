#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Runs the program `vexel-merge-view` with its command line, which begins with its own path. Returns its
/// exit status: 0 once the result is saved, 1 where it was given up or after an error that has been reported
/// in one line.
int RunView(const std::vector<std::string>& command_line);

}  // namespace vexel_yaml
