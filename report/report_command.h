#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Runs the program `vexel-merge-report` with the arguments behind its name. Returns its exit status: 0, or 1
/// after an error that has been reported in one line. Rules and type information stay loaded.
int RunReport(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
