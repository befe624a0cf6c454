#pragma once

#include <cstdint>
#include <string>
#include <unordered_map>
#include <vector>

#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

/// Numbers for the elements of lists: equal for those that hold the same fields, in whatever order, and for
/// no others.
class ElementIds {
 public:
  /// The number of each element of `list`, in its order.
  std::vector<uint32_t> Of(const YAMLSequence& list);

  /// How many numbers there are; they begin at 0.
  size_t Count() const { return ids_.size(); }

 private:
  std::unordered_map<std::string, uint32_t> ids_;
};

}  // namespace vexel_yaml
