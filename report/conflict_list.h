#pragma once

#include <string>
#include <vector>

#include "merge/recording_conflict_resolver.h"

namespace vexel_yaml {

/// A conflict that nobody has settled, in a few words for people.
struct ListedConflict {
  std::string place;  ///< A pattern for its path, and for no other.
  std::string left;   ///< What left did, "-" for nothing.
  std::string right;
};

/// The pending conflicts of a merge, in the order of its records.
std::vector<ListedConflict> ListConflicts(const RecordingConflictResolver& resolver);

}  // namespace vexel_yaml
