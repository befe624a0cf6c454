#include <algorithm>

#include "diff/yaml_mapping_diff.h"
#include "merge/replaced_path.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

const ChangeSequenceOperation* MergeKeyOrders(const ChangeSequenceOperation* left,
                                              const ChangeSequenceOperation* right,
                                              ConflictResolver& resolver) {
  if (left == nullptr || right == nullptr) return left != nullptr ? left : right;
  const ReplacedPath path(resolver, {YAMLScalar::underscore});
  // A key that one side removed keeps its place in the order: whether its entry stays is decided below.
  return ChangeSequenceOperation::Merge(*left, *right, resolver, false);
}

}  // namespace

YAMLMappingDiff* YAMLMappingDiff::Merge(const YAMLMappingDiff& left, const YAMLMappingDiff& right,
                                        ConflictResolver& resolver) {
  auto* merged = YAMLAlloc<YAMLMappingDiff>::create();
  merged->SetKeyOrder(MergeKeyOrders(left.GetKeyOrder(), right.GetKeyOrder(), resolver));

  std::vector<Key> keys;
  left.GetKeys(keys);
  right.GetKeys(keys);
  // Stable: of two keys with one position left's comes first.
  std::stable_sort(keys.begin(), keys.end(), KeyIndexCompareLessThan);
  for (const Key& key : keys) {
    const ResolverPathStep step(resolver, key.key);
    const Operation* operation = Operation::Merge(left.Get(key.key), right.Get(key.key), resolver);
    if (operation != nullptr) merged->Add(key.key, operation);
  }
  return merged;
}

const ChangeMappingOperation* ChangeMappingOperation::Merge(const ChangeMappingOperation& left,
                                                            const ChangeMappingOperation& right,
                                                            ConflictResolver& resolver) {
  return YAMLAlloc<ChangeMappingOperation>::create(
      YAMLMappingDiff::Merge(*left.GetDiff(), *right.GetDiff(), resolver),
      left.IsMergeable() && right.IsMergeable());
}

}  // namespace vexel_yaml
