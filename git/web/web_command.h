#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Goes on with `resolve`, `mergetool` or `review` of vexel-merge-git, the first argument, on a page in the
/// browser. Returns the exit status. Throws CommandError.
int RunOnPage(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
