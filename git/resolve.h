#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Settles conflicts of the files that the arguments name. Returns 0, or 1 where something is left. Throws
/// CommandError.
int RunResolve(const std::vector<std::string>& arguments);

/// Removes the records of conflicts that are gone, from any folder of the work tree, and with "--committed"
/// those of what is staged, too: what hooks call.
int RunSweep(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
