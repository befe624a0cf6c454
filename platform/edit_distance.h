#pragma once

#include <cstddef>
#include <string_view>

namespace vexel_yaml {

/// How many characters have to be changed, added or left out to make one text of the other; case is for free.
size_t EditDistance(std::string_view a, std::string_view b);

}  // namespace vexel_yaml
