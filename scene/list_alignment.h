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
  /// Whether the side has an element with another key there: it put something in the place of base's.
  bool is_replaced_by_left = false;
  bool is_replaced_by_right = false;

  bool IsReplaced() const { return is_replaced_by_left || is_replaced_by_right; }
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
/// A list that no rule says more of may be a set of references or a row of slots. Elements are known by their
/// keys first, wherever they stand, and then what a side put in the place of one is taken for a slot, of
/// which there are not suddenly two.
///
/// Without keys, and in slots, several answers are often possible. None is given where they would make a
/// merge differ: a run of elements that both sides replaced by different numbers of others, equal elements of
/// which one went, a move among them, one element that both sides put into different slots.
std::optional<ListAlignment> AlignLists(const FieldPath& path, const YAMLSequence& base,
                                        const YAMLSequence& left, const YAMLSequence& right);

}  // namespace vexel_yaml
