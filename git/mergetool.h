#pragma once

#include <string>
#include <vector>

#include "git/asset_merge.h"
#include "git/settle.h"

namespace vexel_yaml {

/// Called by git mergetool with base, ours, theirs and the file's path: settles it on a page where there is a
/// display, else by asking in the terminal, else in the editor. What is none of our files goes to the tool
/// that git would have taken. Git stages the result itself, and restores the file where this fails.
int RunMergetool(const std::vector<std::string>& arguments);

/// The versions that it is called with. Changes their files. Throws CommandError.
AssetVersions MergetoolVersions(const std::vector<std::string>& arguments);

/// Settles them as `choice` says. Returns the exit status.
int SettleForMergetool(const AssetVersions& versions, const Choice& choice);

}  // namespace vexel_yaml
