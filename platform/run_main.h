#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Brings what was printed to its reader. False where any of it could not be written, which has been reported
/// with the line "Cannot write to standard output".
bool FlushStandardOutput();

/// What `main` of each program does around its work: calls `run` with the arguments, the first of which is
/// the program's own path, and returns its status. A standard output that can't be written ends with status 1
/// and the same line, an exception with 1 and "Uncaught exception: " + its text.
int RunMain(int argc, char** argv, int (*run)(const std::vector<std::string>& arguments));

}  // namespace vexel_yaml
