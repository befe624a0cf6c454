#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Runs the program `vexel-merge-report` with its command line, which begins with its own path. Returns its
/// exit status: 0, or 1 after an error that has been reported in one line. Rules and type information stay
/// loaded.
int RunReport(const std::vector<std::string>& command_line);

}  // namespace vexel_yaml
