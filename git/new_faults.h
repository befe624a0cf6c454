#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// What is broken in a scene and in none of the texts that it was made from, in a line each for people. A
/// text that is no asset has no faults; one that can't be read has one.
std::vector<std::string> NewFaults(const std::string& text, const std::vector<std::string>& before);

}  // namespace vexel_yaml
