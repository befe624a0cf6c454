#pragma once

namespace vexel_yaml {

/// Prints the usage text on standard output.
void usage();

}  // namespace vexel_yaml
