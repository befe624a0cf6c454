#pragma once

#include <string>

#include "app/command_line.h"

namespace vexel_yaml {

/// Merges the three files structurally and writes the result to `output_path`, the conflict records to the
/// conflict file or standard output, and, where conflicts are pending and both premerge destinations are set,
/// the premerged files. Returns 0 without pending conflicts, 2 with, 3 with component dependencies among
/// them, and 1 after a reported error. Throws YAMLError for files that can't be merged, FileError for files
/// that can't be written; standard exceptions pass.
int HandleMergeCommand(const MergeConfig& config, const std::string& output_path);

}  // namespace vexel_yaml
