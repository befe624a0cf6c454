#pragma once

#include <string>

#include "app/command_line.h"

namespace vexel_yaml {

/// Merges the three files structurally and writes the result to the destination or, where conflicts are
/// pending and a fallback tool is to settle them, to `path_for_tool`; the conflict records go to the conflict
/// file or standard output, and the premerged files, where conflicts are pending and both have destinations,
/// to these. All files are replaced at the end, or none. Without a destination the merge is only a check.
/// Returns 0 without pending conflicts, 2 with, 3 with component dependencies among them, and 1 after a
/// reported error. Throws YAMLError for files that can't be merged, FileError for files that can't be read or
/// written; standard exceptions pass.
int HandleMergeCommand(const MergeConfig& config, const std::string& path_for_tool);

}  // namespace vexel_yaml
