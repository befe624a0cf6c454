#pragma once

#include "app/command_line.h"

namespace vexel_yaml {

/// Runs the command that the arguments name and returns the program's exit status. Standard exceptions pass.
int InnerMain(const CommandLineArguments& arguments);

}  // namespace vexel_yaml
