#include "scene/merge_order.h"

#include <algorithm>
#include <iterator>
#include <unordered_map>

namespace vexel_yaml {

namespace {

template <typename Name>
using Names = std::unordered_set<Name>;

template <typename Name>
Names<Name> SetOf(const std::vector<Name>& order) {
  return {order.begin(), order.end()};
}

template <typename Name>
std::vector<Name> Only(const std::vector<Name>& order, const Names<Name>& wanted) {
  std::vector<Name> rest;
  std::ranges::copy_if(order, std::back_inserter(rest), [&](Name name) { return wanted.contains(name); });
  return rest;
}

// Whether two orders put the elements that both name, and all of `common`, differently.
template <typename Name>
bool Differ(const std::vector<Name>& a, const std::vector<Name>& b, const Names<Name>& common) {
  return Only(a, common) != Only(b, common);
}

// Whether `changed` moved an element of base, though it may be one that the other side removed.
template <typename Name>
bool MovesAny(const std::vector<Name>& base, const std::vector<Name>& changed) {
  return Only(base, SetOf(changed)) != Only(changed, SetOf(base));
}

// Whose order the elements of base stand in.
template <typename Name>
MergeResolve ChooseSide(const ThreeOrders<Name>& versions, bool& is_conflict) {
  const Names<Name> left = SetOf(versions.left), right = SetOf(versions.right);
  Names<Name> common;
  for (const Name name : versions.base) {
    if (left.contains(name) && right.contains(name)) common.insert(name);
  }
  const bool left_moves = Differ(versions.base, versions.left, common);
  const bool right_moves = Differ(versions.base, versions.right, common);
  is_conflict = left_moves && right_moves && Differ(versions.left, versions.right, common);
  if (left_moves) return MergeResolve::kLeft;
  if (right_moves) return MergeResolve::kRight;
  if (MovesAny(versions.base, versions.left)) return MergeResolve::kLeft;
  return MovesAny(versions.base, versions.right) ? MergeResolve::kRight : MergeResolve::kBase;
}

// Whether what each side added stands where it put it: among its other additions and, unless only the other
// side moved some, among the elements of base.
template <typename Name>
bool HasAdditionsAsPlaced(const ThreeOrders<Name>& versions, const std::vector<Name>& order,
                          MergeResolve mover) {
  const Names<Name> base = SetOf(versions.base);
  const auto is_as_placed = [&](const std::vector<Name>& version, MergeResolve other) {
    Names<Name> placed = SetOf(Only(order, SetOf(version)));
    if (mover == other) std::erase_if(placed, [&](Name name) { return base.contains(name); });
    return !Differ(order, version, placed);
  };
  return is_as_placed(versions.left, MergeResolve::kRight) &&
         is_as_placed(versions.right, MergeResolve::kLeft);
}

// An order that grows: elements are hung behind those that they follow.
template <typename Name>
class GrowingOrder {
 public:
  explicit GrowingOrder(std::vector<Name> skeleton)
      : skeleton_(std::move(skeleton)), placed_(skeleton_.begin(), skeleton_.end()) {}

  // Places what `version` has and no one has placed yet.
  void Place(const std::vector<Name>& version) {
    std::vector<Name>* followers = &first_;
    for (const Name name : version) {
      if (placed_.insert(name).second) followers->push_back(name);
      followers = &followers_[name];
    }
  }

  std::vector<Name> Flatten() const {
    std::vector<Name> flat;
    // The top is next. Additions to one place hang behind one another, so recursion would go as deep as they
    // are many.
    std::vector<Name> waiting(skeleton_.rbegin(), skeleton_.rend());
    waiting.insert(waiting.end(), first_.rbegin(), first_.rend());
    while (!waiting.empty()) {
      const Name name = waiting.back();
      waiting.pop_back();
      flat.push_back(name);
      const auto found = followers_.find(name);
      if (found != followers_.end()) {
        waiting.insert(waiting.end(), found->second.rbegin(), found->second.rend());
      }
    }
    return flat;
  }

 private:
  std::vector<Name> skeleton_;
  Names<Name> placed_;
  std::vector<Name> first_;
  std::unordered_map<Name, std::vector<Name>> followers_;
};

// The elements of base as `side` has them, with the additions of right placed first, or those of left.
template <typename Name>
std::vector<Name> OrderAs(const ThreeOrders<Name>& versions, const Names<Name>& members, MergeResolve side,
                          bool is_right_first) {
  const std::vector<Name>& reference = side == MergeResolve::kLeft    ? versions.left
                                       : side == MergeResolve::kRight ? versions.right
                                                                      : versions.base;
  // Removed elements stay in it until the end: what one side put in their place would else be mixed with
  // what the other put nearby.
  GrowingOrder<Name> growing(Only(reference, SetOf(versions.base)));
  growing.Place(is_right_first ? versions.right : versions.left);
  growing.Place(is_right_first ? versions.left : versions.right);
  growing.Place(versions.base);
  return Only(growing.Flatten(), members);
}

}  // namespace

template <typename Name>
MergedOrder<Name> MergeOrder(const ThreeOrders<Name>& versions, const std::unordered_set<Name>& members,
                             std::optional<MergeResolve> side) {
  MergedOrder<Name> merged;
  const MergeResolve chosen = side ? *side : ChooseSide(versions, merged.is_conflict);
  const bool is_right_first = chosen == MergeResolve::kRight;
  merged.order = OrderAs(versions, members, chosen, is_right_first);
  if (side || HasAdditionsAsPlaced(versions, merged.order, chosen)) return merged;
  std::vector<Name> other = OrderAs(versions, members, chosen, !is_right_first);
  if (HasAdditionsAsPlaced(versions, other, chosen)) {
    merged.order = std::move(other);
  } else {
    merged.is_conflict = true;
  }
  return merged;
}

template MergedOrder<const YAMLScalar*> MergeOrder(const ThreeOrders<const YAMLScalar*>&,
                                                   const std::unordered_set<const YAMLScalar*>&,
                                                   std::optional<MergeResolve>);
template MergedOrder<uint32_t> MergeOrder(const ThreeOrders<uint32_t>&, const std::unordered_set<uint32_t>&,
                                          std::optional<MergeResolve>);

}  // namespace vexel_yaml
