#pragma once

#include <cstdint>
#include <optional>
#include <unordered_set>
#include <vector>

#include "yaml/yaml_scalar.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

/// Three lists as numbers: equal ones for what has the same key or, without keys, the same content.
struct NumberedLists {
  std::vector<uint32_t> base;
  std::vector<uint32_t> left;
  std::vector<uint32_t> right;
  size_t id_count = 0;
  /// Whether all elements are references, or have the file ID of one.
  bool are_references = false;
  /// What refers to nothing. An empty slot is known by its place alone: with keys, each has its own number.
  std::unordered_set<uint32_t> empty = {};
};

/// Whether what one side put in the place of an element may be taken for its slot: no rule says more of the
/// list. `key_paths`: what identifies its elements.
bool HasSlots(const std::vector<FieldPath>& key_paths);

/// Nothing where an element of a list has no key, or shares it.
std::optional<NumberedLists> NumberByKeys(const std::vector<FieldPath>& key_paths, const YAMLSequence& base,
                                          const YAMLSequence& left, const YAMLSequence& right);

NumberedLists NumberByContent(const std::vector<FieldPath>& key_paths, const YAMLSequence& base,
                              const YAMLSequence& left, const YAMLSequence& right);

}  // namespace vexel_yaml
