#pragma once

#include <string>
#include <vector>

#include "git/repository.h"

namespace vexel_yaml {

/// Git tells nobody that a merge was aborted, or a file added by hand, but it has hooks for every change of
/// the index and for commits. Ours are there only as long as a record is, and never in place of others. None
/// of them is of any use where git calls hooks of another folder.

/// Puts the hooks in their places, where these are free, and brings them up to date. False where it can't.
bool PlaceHooks(const Repository& repository);

/// The hooks that could stop a commit, but are somebody's own and don't ask us. `other_folder` is the one
/// whose hooks git calls, if it isn't the repository's.
std::vector<std::string> ForeignGuards(const Repository& repository, const std::string& other_folder);

/// Whether any of ours is there.
bool HaveHooks(const Repository& repository);

/// Takes back what is ours. What somebody has added to it stays.
void TakeHooksAway(const Repository& repository);

}  // namespace vexel_yaml
