#pragma once

#include <string>

#include "git/merged_commits.h"
#include "git/repository.h"
#include "git/side_names.h"

namespace vexel_yaml {

/// The sides of a merge that has stopped, by these names, with who has changed the file there, such as "Ann,
/// feature/lights".
SideNames WithPeople(SideNames names, const Repository& repository, const std::string& asset);

/// What people call the sides of a merge commit: as its message has them, or else by the branch that has
/// theirs and the one that the merge was made on, or by their hashes.
SideNames BranchesOf(const MergedCommits& merged);

/// The same with who has changed the file there.
SideNames PeopleBehind(const MergedCommits& merged, const SideNames& branches, const std::string& asset);

}  // namespace vexel_yaml
