#pragma once

#include "git/repository.h"

namespace vexel_yaml {

/// Git tells nobody that a merge was aborted, or a file added by hand, but it has hooks for every change of
/// the index and for commits. Ours are there only as long as a record is, and never in place of others. None
/// of them is of any use where git calls hooks of another folder.

/// Puts the hooks in their places, where these are free, and brings them up to date.
void PlaceHooks(const Repository& repository);

void TakeHooksAway(const Repository& repository);

}  // namespace vexel_yaml
