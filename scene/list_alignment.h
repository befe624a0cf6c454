#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "yaml/yaml_scalar.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

constexpr uint32_t kNoIndex = 0xFFFFFFFF;

/// One element of a list in three versions: its index in each, kNoIndex where it isn't.
struct AlignedElement {
  uint32_t base = kNoIndex;
  uint32_t left = kNoIndex;
  uint32_t right = kNoIndex;
  /// Whether both sides put something in the place of an element that has a key: other elements.
  bool is_replaced = false;
};

struct ListAlignment {
  /// Those of base first, in its order, then those that left added, then those that right alone added.
  std::vector<AlignedElement> elements;
  /// Whether keys identify the elements. Where none do, only equal ones are known to be one; one that was
  /// edited is known by the elements around it.
  bool has_keys = false;
};

/// Lines up the elements of the list at `path` in three versions.
///
/// A list of references may be a set or a row of slots. What both sides put in the place of one reference is
/// taken for a slot, of which there are not suddenly two: runs of equal length, of others that the other side
/// doesn't have.
///
/// Without keys, several answers are often possible. None is given where they would make a merge differ: a
/// run of elements that both sides replaced by different numbers of others, equal elements of which one went,
/// a move among them.
std::optional<ListAlignment> AlignLists(const FieldPath& path, const YAMLSequence& base,
                                        const YAMLSequence& left, const YAMLSequence& right);

}  // namespace vexel_yaml
