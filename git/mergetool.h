#pragma once

#include <string>
#include <vector>

#include "git/asset_merge.h"
#include "git/settle.h"

namespace vexel_yaml {

/// Called by git mergetool, as MergetoolCall says: settles the file on a page where there is a display, else
/// by asking in the terminal, else in the editor. What is none of our files goes to the tool that git would
/// have taken. Git stages the result itself, and restores the file where this fails.
int RunMergetool(const std::vector<std::string>& arguments);

struct MergetoolCall {
  /// Base, ours and theirs come before the file's path.
  AssetVersions versions;
  /// The last file that git opens, from the top folder; empty where older settings don't tell.
  std::string last;
};

/// What the arguments say. Changes the versions' files. Throws CommandError.
MergetoolCall ParseMergetool(const std::vector<std::string>& arguments);

/// Settles the file as `choice` says. Returns the exit status.
int SettleForMergetool(const MergetoolCall& call, const Choice& choice);

}  // namespace vexel_yaml
