#pragma once

#include "app/command_line.h"

namespace vexel_yaml {

/// The program's own proof that diffing and merging do what they must: with no argument behind "unittest" on
/// scenes of its own, with three paths on the user's base, left and right. Prints a line a law and
/// "N passed, N failed". Returns 0, or 1 where a law is broken or the user's files can't be merged. Throws
/// what reading, diffing and merging throw.
int HandleUnittestCommand(const CommandLineArguments& arguments);

}  // namespace vexel_yaml
