#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Merges a file that git has at hand. Git calls it in the top folder, with three temporary files, base, ours
/// and theirs, the size of its conflict markers and the file's path; ours takes the result. With "--ancestor"
/// in front, the result is a common ancestor of what git merges afterwards, and nobody is told anything.
/// Returns 0, or else for a conflict, as git wants it. Throws CommandError.
int RunMergeDriver(std::vector<std::string> arguments);

/// Prints a file for git's diff, as `vexel-merge-report --text` does.
int RunTextconv(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
