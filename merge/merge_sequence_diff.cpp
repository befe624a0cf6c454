#include <unordered_set>

#include "diff/yaml_sequence_diff.h"
#include "merge/conflict_resolver.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

const YAMLScalar* IndexScalar(int index) { return YAMLScalar::Lookup(IntToString(index)); }

// The values that one side added to a list, and where.
class AddedValues {
 public:
  explicit AddedValues(const YAMLSequenceDiff& diff) {
    for (const auto& [index, operation] : diff.GetEntries()) {
      if (operation->GetKind() != Operation::Kind::kAdd) continue;
      indices_.push_back(index);
      // Borrowed, and only read.
      values_.Append(const_cast<YAMLNode*>(static_cast<const AddOperation*>(operation)->GetValue()));
    }
  }
  AddedValues(const AddedValues&) = delete;
  AddedValues& operator=(const AddedValues&) = delete;
  ~AddedValues() { values_.SwapItems({}); }

  const YAMLSequence& GetValues() const { return values_; }
  int GetIndex(size_t position) const { return indices_[position]; }

 private:
  std::vector<int> indices_;
  YAMLSequence values_{false};
};

// A diff of its own with the same operations: whoever gets to see them in a conflict finds those of the side.
YAMLSequenceDiff* Copy(const YAMLSequenceDiff& diff) {
  auto* copy = YAMLAlloc<YAMLSequenceDiff>::create();
  for (const auto& [index, operation] : diff.GetEntries()) copy->Add(index, operation);
  return copy;
}

// Both sides of a list, aligned step by step. What has to be modified is copied first.
class SequenceMerge {
 public:
  SequenceMerge(const ChangeSequenceOperation& left, const ChangeSequenceOperation& right,
                ConflictResolver& resolver)
      : left_diff_(left.GetDiff()),
        right_diff_(right.GetDiff()),
        left_remapper_(left.GetRemapper()),
        right_remapper_(right.GetRemapper()),
        resolver_(resolver) {}

  // Elements that both sides added as the same element become one, at its place on the left.
  void PairAdditions(const std::vector<FieldPath>& key_paths) {
    const AddedValues left(*left_diff_);
    const AddedValues right(*right_diff_);
    if (left.GetValues().Size() == 0 || right.GetValues().Size() == 0) return;
    YAMLSequenceRemapper* partners =
        YAMLSequenceRemapper::FindIdMapping(key_paths, left.GetValues(), right.GetValues(), true);
    YAMLSequenceDiff* paired = nullptr;
    std::set<int> right_copies;
    for (size_t i = 0; i < partners->GetMapping().size(); ++i) {
      const uint32_t partner = partners->GetMapping()[i];
      if (partner == YAMLSequenceRemapper::kDropped) continue;
      if (paired == nullptr) paired = Copy(*left_diff_);
      const int left_index = left.GetIndex(i);
      const int right_index = right.GetIndex(partner);
      const ResolverPathStep step(resolver_, IndexScalar(left_index));
      const Operation* settled =
          Operation::Merge(left_diff_->Get(left_index), right_diff_->Get(right_index), resolver_);
      paired->Replace(left_index, settled);
      if (settled != nullptr) settled_.insert(settled);
      right_copies.insert(right_index);
    }
    YAMLAlloc<YAMLSequenceRemapper>::free(partners);
    if (paired == nullptr) return;
    left_diff_ = paired;
    RemoveFromRight(right_copies);
  }

  // Brings both diffs into one numbering; returns the remapper from base to it, null for the identity.
  YAMLSequenceRemapper* Align(bool drop_if_removed_on_either_side) {
    if (left_remapper_ == nullptr || right_remapper_ == nullptr) return AlignOneSided();
    YAMLSequenceRemapper* left_out = nullptr;
    YAMLSequenceRemapper* right_out = nullptr;
    YAMLSequenceRemapper* merged = YAMLSequenceRemapper::Merge(*left_remapper_, *right_remapper_, left_out,
                                                               right_out, drop_if_removed_on_either_side);
    left_diff_ = left_diff_->Remap(*left_out);
    right_diff_ = right_diff_->Remap(*right_out);
    YAMLAlloc<YAMLSequenceRemapper>::free(left_out);
    YAMLAlloc<YAMLSequenceRemapper>::free(right_out);
    return merged;
  }

  // What a pair of additions was settled to stays: asked again, as an addition of left's alone, the user's
  // choice of right's would refuse it, and the element would be gone from both sides.
  YAMLSequenceDiff* MergeDiffs(std::set<int>& dropped) {
    YAMLSequenceDiff* merged = YAMLSequenceDiff::Merge(*left_diff_, *right_diff_, dropped, resolver_);
    if (settled_.empty()) return merged;
    for (const auto& [index, operation] : left_diff_->GetEntries()) {
      if (settled_.contains(operation) && dropped.erase(index) != 0) merged->Add(index, operation);
    }
    return merged;
  }

 private:
  void RemoveFromRight(const std::set<int>& indices) {
    YAMLSequenceDiff* diff = Copy(*right_diff_);
    diff->RemoveAndShiftMany(indices);
    right_diff_ = diff;
    auto* remapper = YAMLAlloc<YAMLSequenceRemapper>::create(*right_remapper_);
    remapper->RemoveDestinations({indices.begin(), indices.end()});
    right_remapper_ = remapper;
  }

  // Where one side moved nothing, the other's layout is the common one.
  YAMLSequenceRemapper* AlignOneSided() {
    const YAMLSequenceRemapper* survivor = left_remapper_ == nullptr ? right_remapper_ : left_remapper_;
    if (survivor == nullptr || survivor->GetMapping().empty()) return nullptr;
    if (left_remapper_ == nullptr) {
      left_diff_ = left_diff_->Remap(*survivor);
    } else {
      right_diff_ = right_diff_->Remap(*survivor);
    }
    return YAMLAlloc<YAMLSequenceRemapper>::create(*survivor);
  }

  const YAMLSequenceDiff* left_diff_;
  const YAMLSequenceDiff* right_diff_;
  const YAMLSequenceRemapper* left_remapper_;
  const YAMLSequenceRemapper* right_remapper_;
  ConflictResolver& resolver_;
  // What pairs of additions were merged to.
  std::unordered_set<const Operation*> settled_;
};

// Whether both sides made the same edit of a list. Under a rule of the list's own the elements are gone
// through one by one, so that each gets its record; where nothing but the layout changed, the layouts are
// merged.
bool IsSameEdit(const ChangeSequenceOperation& left, const ChangeSequenceOperation& right,
                const std::vector<FieldPath>& key_paths) {
  return !left.GetDiff()->GetEntries().empty() && !right.GetDiff()->GetEntries().empty() &&
         key_paths == YAMLSequenceRemapper::defaultPath && OperationEquals(left, right);
}

// "No operation" leaves a place as it is in base: a base element stays, but the slot of an addition that was
// not taken goes, and what stands behind it moves down.
void CloseDroppedSlots(const std::set<int>& dropped, YAMLSequenceDiff& diff, YAMLSequenceRemapper& remapper) {
  if (dropped.empty()) return;
  std::vector<bool> holds_base_element(remapper.GetDestinationCount(), false);
  for (const uint32_t target : remapper.GetMapping()) {
    if (target != YAMLSequenceRemapper::kDropped) holds_base_element[target] = true;
  }
  std::set<int> closed;
  for (const int index : dropped) {
    if (!holds_base_element.at(static_cast<size_t>(index))) closed.insert(index);
  }
  diff.RemoveAndShiftMany(closed);
  remapper.RemoveDestinations({closed.begin(), closed.end()});
}

}  // namespace

YAMLSequenceDiff* YAMLSequenceDiff::Merge(const YAMLSequenceDiff& left, const YAMLSequenceDiff& right,
                                          std::set<int>& dropped, ConflictResolver& resolver) {
  std::set<int> indices;
  left.GetKeys(indices);
  right.GetKeys(indices);
  auto* merged = YAMLAlloc<YAMLSequenceDiff>::create();
  for (const int index : indices) {
    const ResolverPathStep step(resolver, IndexScalar(index));
    const Operation* operation = Operation::Merge(left.Get(index), right.Get(index), resolver);
    if (operation == nullptr) {
      dropped.insert(index);
    } else {
      merged->Add(index, operation);
    }
  }
  return merged;
}

const ChangeSequenceOperation* ChangeSequenceOperation::Merge(const ChangeSequenceOperation& left,
                                                              const ChangeSequenceOperation& right,
                                                              ConflictResolver& resolver,
                                                              bool drop_if_removed_on_either_side) {
  SequenceMerge merge(left, right, resolver);
  if (left.remapper_ != nullptr && right.remapper_ != nullptr) {
    const std::vector<FieldPath>& key_paths = YAMLSequenceRemapper::ChooseKeyPaths(resolver.GetPath());
    if (IsSameEdit(left, right, key_paths)) return &left;
    if (left.remapper_->IsSetRemapper()) merge.PairAdditions(key_paths);
  }
  YAMLSequenceRemapper* remapper = merge.Align(drop_if_removed_on_either_side);
  std::set<int> dropped;
  YAMLSequenceDiff* diff = merge.MergeDiffs(dropped);
  if (remapper != nullptr) {
    CloseDroppedSlots(dropped, *diff, *remapper);
    if (remapper->GetMapping().empty()) {
      YAMLAlloc<YAMLSequenceRemapper>::free(remapper);
      remapper = nullptr;
    }
  }
  return YAMLAlloc<ChangeSequenceOperation>::create(diff, remapper,
                                                    left.IsMergeable() && right.IsMergeable());
}

}  // namespace vexel_yaml
