#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Says what merging a branch into the current commit would do to the files that both have changed: which
/// objects, and who collides with whom. Nothing of the repository is written. Returns 0, or 1 where there
/// would be conflicts. Throws CommandError.
int RunPreview(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
