#pragma once

#include <string>

namespace vexel_yaml {

/// The absolute path of the running executable, symbolic links resolved; empty when the system doesn't tell.
std::string ExecutablePath();

}  // namespace vexel_yaml
