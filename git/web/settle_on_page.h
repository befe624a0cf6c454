#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// `resolve --web`: all files one after the other, each of which is staged when it is saved. Returns 0, or 1
/// where something is left. Throws CommandError.
int ResolveOnPage(const std::vector<std::string>& arguments);

/// The same for the one file that git mergetool calls with; git stages it.
int MergetoolOnPage(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
