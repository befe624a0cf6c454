#pragma once

#include <string>

#include "report/object_names.h"

namespace vexel_yaml {

/// A merge's line for people with names in place of file IDs and paths, as far as these are known.
std::string NamedNote(const std::string& note, ObjectNames& names);

}  // namespace vexel_yaml
