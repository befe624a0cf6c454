#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// `review`: what changed between two commits, or between one and the work tree, object by object. Returns
/// 0. Throws CommandError, also where nothing of ours has changed.
int ReviewOnPage(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
