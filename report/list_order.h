#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "rules/yaml_sequence_remapper.h"

namespace vexel_yaml {

/// For each element of a changed list, the base element that it was, or kDropped. `remapper` may be null.
std::vector<uint32_t> Origins(const YAMLSequenceRemapper* remapper, size_t from_size, size_t to_size);

/// The elements that were moved, by their places in the changed list: the fewest that must have been.
std::set<size_t> FindMoved(const std::vector<uint32_t>& origins, size_t to_size);

/// These elements of a list, with dots for the rest.
std::string Elided(const std::vector<std::string>& list, const std::set<size_t>& shown);

/// The part of a changed list that is in another order now, with dots for what is not. Of a long part, what
/// was moved and what stands beside that.
std::string OrderText(const std::vector<std::string>& list, const std::vector<uint32_t>& origins,
                      size_t from_size);

}  // namespace vexel_yaml
