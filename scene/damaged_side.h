#pragma once

#include <string>
#include <vector>

#include "yaml/read_files.h"

namespace vexel_yaml {

/// What makes a side look as if a part of its file had been lost, in a line for people for each of the two
/// sides that does: it ends in the middle of an object, or more than half of base's objects, which are 50
/// or more, are not in it, while the other side has all of them. A merge can't tell such a loss from a day's
/// work. `versions` are base, left and right, prepared for a diff.
std::vector<std::string> DescribeDamage(const std::vector<FileToRead>& versions);

}  // namespace vexel_yaml
