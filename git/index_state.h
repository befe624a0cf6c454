#pragma once

#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace vexel_yaml {

/// What the index says of conflicts. All paths are from the top folder, which is the current one.

struct ConflictPaths {
  std::set<std::string> unmerged;
  /// In conflict until somebody has staged them; git remembers their versions for a while.
  std::set<std::string> staged;
};

/// Nothing where git fails. An index that a command of the user has at work doesn't count.
std::optional<ConflictPaths> PathsInConflict();

/// The blobs of the index, at least those of the paths. Nothing where git fails.
std::optional<std::map<std::string, std::string>> IndexBlobs(const std::vector<std::string>& paths);

/// The files that the next commit changes, with their blobs; empty for one that it removes or that is in
/// conflict. The index of the user's command counts.
std::map<std::string, std::string> StagedChanges();

}  // namespace vexel_yaml
