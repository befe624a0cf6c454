#pragma once

#include <string_view>

namespace vexel_yaml {

/// Whether `a` comes before `b` as people count: "Lamp 20" before "Lamp 100". A strict order of all texts.
bool ComesBefore(std::string_view a, std::string_view b);

}  // namespace vexel_yaml
