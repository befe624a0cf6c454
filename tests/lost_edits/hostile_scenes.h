#pragma once

#include <cstdint>
#include <string>

namespace vexel_yaml::lost_edits {

/// Three versions of one small scene, as texts without directives.
struct HostileTriple {
  std::string base;
  std::string left;
  std::string right;
};

/// Always the same for one seed. Made to confuse a merge: few different values, so that edits meet and
/// elements repeat; lists with key fields that are missing or repeated; lists of some hundred elements;
/// values that turn into another kind; edits that both sides make.
HostileTriple MakeHostileTriple(uint32_t seed);

}  // namespace vexel_yaml::lost_edits
