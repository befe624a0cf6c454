#pragma once

#include <functional>
#include <string>
#include <vector>

namespace vexel_yaml {

/// Runs `change`, which writes or removes some of these files, and puts them back as they were where it
/// returns false or throws a std::runtime_error, which is said. Signals wait meanwhile. Returns whether all
/// is changed.
bool AllOrNothing(const std::vector<std::string>& paths, const std::function<bool()>& change);

}  // namespace vexel_yaml
