#include "merge/merge_additions.h"

#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

// What both sides say of the object itself is no matter of choice: without its file ID or class it could not
// be written, without its mark it would be another object. Where a choice kept neither side's, left's stands.
void RestorePseudoKeys(const YAMLMapping& left, const YAMLMapping& right, YAMLMapping& merged) {
  for (const YAMLScalar* key : {YAMLScalar::fileIDPlaceHolderName, YAMLScalar::classIDPlaceHolderName,
                                YAMLScalar::strippedPrefabPlaceHolderName}) {
    const YAMLNode* value = left.Get(key);
    if (value != nullptr && right.HasKey(key) && !merged.HasKey(key)) merged.Insert(key, value->Clone());
  }
}

YAMLNode* MergeAddedMappings(const YAMLMapping& left, const YAMLMapping& right, ConflictResolver& resolver) {
  const YAMLMapping empty(left.IsFlow());
  FieldPath path = resolver.GetPath();
  const YAMLMappingDiff* left_diff = YAMLMappingDiff::Diff(path, empty, left);
  const YAMLMappingDiff* right_diff = YAMLMappingDiff::Diff(path, empty, right);
  auto* merged = YAMLAlloc<YAMLMapping>::create(left.IsFlow());
  YAMLMappingDiff::Merge(*left_diff, *right_diff, resolver)->Apply(*merged);
  RestorePseudoKeys(left, right, *merged);
  return merged;
}

YAMLNode* MergeAddedSequences(const YAMLSequence& left, const YAMLSequence& right,
                              ConflictResolver& resolver) {
  FieldPath path = resolver.GetPath();
  const YAMLSequenceDiff* left_diff = YAMLSequenceDiff::Diff(path, {}, left.GetItems());
  const YAMLSequenceDiff* right_diff = YAMLSequenceDiff::Diff(path, {}, right.GetItems());
  auto* merged = YAMLAlloc<YAMLSequence>::create(left.IsFlow());
  std::set<int> dropped;
  YAMLSequenceDiff::Merge(*left_diff, *right_diff, dropped, resolver)->Apply(*merged);
  std::vector<YAMLNode*> items = merged->GetItems();
  std::erase(items, nullptr);
  merged->SwapItems(std::move(items));
  return merged;
}

}  // namespace

const AddOperation* MergeAddedValues(const AddOperation& left, const AddOperation& right,
                                     ConflictResolver& resolver) {
  const YAMLNode& left_value = *left.GetValue();
  const YAMLNode& right_value = *right.GetValue();
  if (left_value.GetKind() != right_value.GetKind() || left_value.AsScalar() != nullptr) return nullptr;
  YAMLNode* merged = left_value.AsMapping() != nullptr
                         ? MergeAddedMappings(*left_value.AsMapping(), *right_value.AsMapping(), resolver)
                         : MergeAddedSequences(*left_value.AsSequence(), *right_value.AsSequence(), resolver);
  return YAMLAlloc<AddOperation>::create(merged, left.IsMergeable());
}

}  // namespace vexel_yaml
