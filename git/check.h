#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Says which conflicts nobody has settled, and which scenes are broken that weren't before: among the files
/// that the arguments name, or all that are in conflict, in what is staged, or in a commit. Returns 0, or 1
/// where there are some. Throws CommandError.
int RunCheck(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
