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

/// Nothing where git fails. An index that a command of the user has at work counts only if `in_users_index`.
std::optional<ConflictPaths> PathsInConflict(bool in_users_index = false);

/// The blobs of the index, at least those of the paths. Nothing where git fails.
std::optional<std::map<std::string, std::string>> IndexBlobs(const std::vector<std::string>& paths,
                                                             bool in_users_index = false);

/// The files that the next commit changes, with their blobs; empty for one that it removes or that is in
/// conflict. Before the first commit, that is all of the index.
std::map<std::string, std::string> StagedChanges(bool in_users_index = true);

/// Those of the files that the work tree has otherwise than the index.
std::set<std::string> EditedFiles(const std::vector<std::string>& paths);

}  // namespace vexel_yaml
