#pragma once

namespace vexel_yaml {

/// Whether a program started here could show a window to the person who started this one.
bool HasDisplay();

}  // namespace vexel_yaml
