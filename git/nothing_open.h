#pragma once

namespace vexel_yaml {

/// Says what there is where no file of ours is in conflict: what was settled and isn't committed yet, and how
/// to go on. Returns the exit status: 0 where nothing is left of what was in conflict. The current folder is
/// the top one.
int SayNothingOpen();

}  // namespace vexel_yaml
