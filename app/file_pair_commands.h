#pragma once

#include "app/command_line.h"

namespace vexel_yaml {

/// Writes the second file reduced to what differs from the first. An output file is replaced whole or not at
/// all; one that can't be opened or closed is not reported and changes nothing. Returns 0; throws what
/// reading and diffing throw, and FileError for an output that can't be written to its end.
int HandleStripCommand(const StripConfig& config);

/// Prints the changes from the first file to the second. Otherwise the same.
int HandleDiffCommand(const DiffConfig& config);

}  // namespace vexel_yaml
