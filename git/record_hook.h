#pragma once

#include "git/repository.h"

namespace vexel_yaml {

/// Git tells nobody that a merge was aborted, or a file added by hand, but it has a hook for every change of
/// the index. Ours is there only as long as a record is, and never in place of another one. Neither is of any
/// use where git calls hooks of another folder.

/// Puts the hook in its place, where that is free, and brings it up to date.
void PlaceHook(const Repository& repository);

void TakeHookAway(const Repository& repository);

}  // namespace vexel_yaml
