#pragma once

#include <string>

#include "git/repository.h"

namespace vexel_yaml {

/// What the people in a merge call its sides; empty where git tells nobody.
struct SideNames {
  std::string theirs;
  std::string ours;
};

/// Finds them: in what git tells a merge driver, or in the state of the rebase, the cherry-picks or reverts
/// that are under way. In a rebase, whose own commits are "theirs", both have one.
SideNames FindSideNames(const Repository& repository);

/// What the first line of a merge's message says was merged, and into what; empty where it says nothing.
SideNames NamesInMessage(const std::string& message);

/// The folder in git's of a rebase that merges one of its own commits right now, and hasn't stopped for
/// somebody's edits; empty where there is none.
std::string MergingRebase(const Repository& repository);

}  // namespace vexel_yaml
