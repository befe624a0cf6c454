#pragma once

#include "app/command_line.h"

namespace vexel_yaml {

/// Runs one three-way merge as version control asks for it, with its temporary files, the copy to the
/// destination and the hand-over to a fallback tool. Returns the exit status: 0 merged, 1 error (reported),
/// 2 conflicts pending, 3 component dependencies among them, or the status of the fallback tool that ran.
/// Standard exceptions pass; no temporary file is left behind.
int ProcessMergeCommand(const MergeConfig& config);

}  // namespace vexel_yaml
