#pragma once

#include "app/command_line.h"

namespace vexel_yaml {

/// Writes the second file reduced to what differs from the first. Returns 0; throws what reading and diffing
/// throw. An output file that can't be written is not reported.
int HandleStripCommand(const StripConfig& config);

/// Prints the changes from the first file to the second. Otherwise the same.
int HandleDiffCommand(const DiffConfig& config);

}  // namespace vexel_yaml
