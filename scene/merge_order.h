#pragma once

#include <cstdint>
#include <optional>
#include <unordered_set>
#include <vector>

#include "merge/conflict_type.h"
#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

/// The order of one list in three versions. Each element has a name, which occurs once in a version and is
/// the same in all that have the element.
template <typename Name>
struct ThreeOrders {
  std::vector<Name> base;
  std::vector<Name> left;
  std::vector<Name> right;
};

template <typename Name>
struct MergedOrder {
  std::vector<Name> order;
  /// No side was given, and both moved elements of base that all versions have, but not to the same order, or
  /// what one added can't stand in the order that it gave them.
  bool is_conflict = false;
};

/// Merges three orders; of the elements that any of them names the result has those in `members`.
///
/// The elements of base stand as `side` has them (base, left or right). Without one they stand as the side
/// has them that moved some; where both did, differently, it is a conflict, and they stand as in left. What a
/// side added stands behind its predecessor there, or in front where it has none, left's additions before
/// right's; what both added stands where left has it. Where the elements of base stand as right has them,
/// right comes first. Elements that are no members count as predecessors, too. Takes `Name`s that are `const
/// YAMLScalar*` or `uint32_t`.
template <typename Name>
MergedOrder<Name> MergeOrder(const ThreeOrders<Name>& versions, const std::unordered_set<Name>& members,
                             std::optional<MergeResolve> side = std::nullopt);

}  // namespace vexel_yaml
