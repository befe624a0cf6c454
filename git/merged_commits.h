#pragma once

#include <map>
#include <string>
#include <vector>

#include "git/asset_merge.h"
#include "git/stage_files.h"

namespace vexel_yaml {

/// Two commits that are merged, and what they come from, by their hashes.
struct MergedCommits {
  std::string commit;  ///< The merge; empty for one that isn't made.
  std::string base;
  std::string ours;
  std::string theirs;
  /// The files that a side has renamed: base's names by the new ones.
  std::map<std::string, std::string> renamed_by_ours = {};
  std::map<std::string, std::string> renamed_by_theirs = {};
};

/// The merge commit of this name, and its parents. Throws CommandError for any other commit.
MergedCommits FindMerged(const std::string& name);

/// The hash of a commit that somebody names. Throws CommandError where there is none.
std::string FindCommit(const std::string& name);

/// The paths that one of two commits has otherwise than the other one, sorted; those below `paths`, or all.
/// An empty `to` is the work tree.
std::vector<std::string> ChangedPaths(const std::string& from, const std::string& to,
                                      const std::vector<std::string>& paths);

/// Looks what the sides have renamed, as git does in a merge.
void FindRenamed(MergedCommits& merged);

/// What base calls a file of the merge.
std::string OldName(const MergedCommits& merged, const std::string& name);

/// By the names that the merge has for them.
std::vector<std::string> ChangedOnBothSides(const MergedCommits& merged,
                                            const std::vector<std::string>& paths);

/// Writes the versions of a file of the merge, as files whose names say which they are. False where one has
/// none.
bool WriteVersions(const MergedCommits& merged, const std::string& asset, ScratchFolder& scratch,
                   AssetVersions& versions);

/// Writes the file as a commit has it. Returns its path; empty where the commit has none.
std::string WriteVersion(const std::string& commit, const std::string& name, const std::string& asset,
                         ScratchFolder& scratch);

/// Who has changed one of the paths in a range of commits, the latest first.
std::vector<std::string> Authors(const std::string& range, const std::vector<std::string>& paths);

/// The commit as people write it.
std::string ShortHash(const std::string& commit);

}  // namespace vexel_yaml
