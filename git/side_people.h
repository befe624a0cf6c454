#pragma once

#include <string>

#include "git/merged_commits.h"
#include "git/repository.h"
#include "git/side_names.h"

namespace vexel_yaml {

/// The sides of a merge that has stopped, by these names, with who has changed the file there, such as "Ann,
/// feature/lights".
SideNames WithPeople(SideNames names, const Repository& repository, const std::string& asset);

/// The sides of a merge commit.
SideNames PeopleBehind(const MergedCommits& merged, const std::string& asset);

}  // namespace vexel_yaml
