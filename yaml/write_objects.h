#pragma once

#include <ostream>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// Writes an asset file as VexelObjects::Output does, on two threads if `threads`: making the text of the
/// objects takes as long as reading one of the files. Throws what it throws.
void WriteObjects(VexelObjects& objects, std::ostream& out, bool threads);

}  // namespace vexel_yaml
