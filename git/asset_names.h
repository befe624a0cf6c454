#pragma once

#include <string_view>

#include "report/object_names.h"

namespace vexel_yaml {

/// Finds the names of assets by the .meta files that hold their guids, among the tracked ones of the work
/// tree, whose top folder is the current one.
///
/// One call of git grep for all guids: it reads on several threads and knows the files without walking the
/// folders. Reading them from the commits instead would take several times as long, and assets hardly ever
/// change their guids.
AssetNames FindAssetNames(const std::set<std::string>& guids);

/// The names of all assets that these texts of scenes refer to, as `vexel-merge-report --assets` takes them.
std::string AssetLines(const std::vector<std::string>& scenes);

}  // namespace vexel_yaml
