#include <string>

#include "rules/path_step.h"
#include "scene/list_alignment.h"
#include "scene/merge_order.h"
#include "scene/moved_elements.h"
#include "scene/row_of_slots.h"
#include "scene/value_settler.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

const YAMLNode* ElementAt(const YAMLSequence& list, uint32_t index) {
  return index == kNoIndex ? nullptr : list.GetItems()[index];
}

// The path component of an element. What base lacks has a place of its own: no two conflicts of one list may
// have the same path.
const YAMLScalar* NameOf(const AlignedElement& element) {
  const bool is_added = element.base == kNoIndex;
  const uint32_t added = element.left == kNoIndex ? element.right : element.left;
  const std::string index = IntToString(static_cast<int>(is_added ? added : element.base));
  return YAMLScalar::Lookup(is_added ? "+" + index : index);
}

// Whether the rules identify the elements of the list by themselves, so that their order means nothing.
bool IsSet(const FieldPath& path) {
  const std::vector<FieldPath>& key_paths = YAMLSequenceRemapper::ChooseKeyPaths(path);
  return !key_paths.empty() && &key_paths != &YAMLSequenceRemapper::defaultPath;
}

class ListMerge {
 public:
  ListMerge(const YAMLSequence& base, const YAMLSequence& left, const YAMLSequence& right,
            const ListAlignment& alignment, ValueSettler& settler)
      : base_(base), left_(left), right_(right), alignment_(alignment), settler_(settler) {}

  OwnedNodePtr<YAMLSequence> Merge() {
    std::vector<OwnedNode> merged;
    std::unordered_set<uint32_t> members;
    for (uint32_t i = 0; i < alignment_.elements.size(); ++i) {
      merged.push_back(MergeElement(alignment_.elements[i]));
      if (merged.back() != nullptr) members.insert(i);
    }
    const YAMLSequence& style = base_.Size() != 0 ? base_ : left_.Size() != 0 ? left_ : right_;
    OwnedNodePtr<YAMLSequence> list(YAMLAlloc<YAMLSequence>::create(style.IsFlow()));
    list->Reserve(members.size());
    for (const uint32_t i : OrderOf(members)) list->Append(merged[i].release());
    return list;
  }

 private:
  // Null where the element is gone.
  OwnedNode MergeElement(const AlignedElement& element) {
    const ThreeValues values = {ElementAt(base_, element.base), ElementAt(left_, element.left),
                                ElementAt(right_, element.right)};
    if (values.left == nullptr && values.right == nullptr) return nullptr;
    const YAMLScalar* name = NameOf(element);
    {
      const PathStep step(settler_.GetPath(), name);
      if (values.base == nullptr) return MergeAddition(values);
      if (settler_.AreSame(values.base, values.left)) {
        // Last digits and the order of fields are no edits.
        return CopyOf(settler_.AreSame(values.base, values.right) ? values.base : values.right);
      }
      if (settler_.AreSame(values.base, values.right)) return CopyOf(values.left);
      if (settler_.AreSame(values.left, values.right)) return CopyOf(values.left);
      // What only its place tells is taken as a whole: it may be another element.
      if (!alignment_.has_keys || element.IsReplaced() || values.left == nullptr || values.right == nullptr) {
        return CopyOf(values.Get(settler_.Decide(ConflictType::kBothChange, values)));
      }
    }
    return settler_.MergeElement(values, name);
  }

  OwnedNode MergeAddition(const ThreeValues& values) {
    if (values.left != nullptr && values.right != nullptr) {
      return settler_.MergeAdditions(*values.left, *values.right);
    }
    return CopyOf(values.left != nullptr ? values.left : values.right);
  }

  // The elements' indices in the alignment, in the order of the result.
  std::vector<uint32_t> OrderOf(const std::unordered_set<uint32_t>& members) {
    ThreeOrders<uint32_t> orders;
    orders.left.resize(left_.Size());
    orders.right.resize(right_.Size());
    for (uint32_t i = 0; i < alignment_.elements.size(); ++i) {
      const AlignedElement& element = alignment_.elements[i];
      if (element.base != kNoIndex) orders.base.push_back(i);
      if (element.left != kNoIndex) orders.left[element.left] = i;
      if (element.right != kNoIndex) orders.right[element.right] = i;
    }
    MergedOrder<uint32_t> merged = MergeOrder(orders, members);
    if (!merged.is_conflict || IsSet(settler_.GetPath())) return std::move(merged.order);
    const MergeResolve side = settler_.Decide(ConflictType::kBothChange, {&base_, &left_, &right_});
    return MergeOrder(orders, members, side).order;
  }

  const YAMLSequence& base_;
  const YAMLSequence& left_;
  const YAMLSequence& right_;
  const ListAlignment& alignment_;
  ValueSettler& settler_;
};

}  // namespace

OwnedNode MergeLists(const YAMLSequence& base, const YAMLSequence& left, const YAMLSequence& right,
                     ValueSettler& settler) {
  const FieldPath& path = settler.GetPath();
  if (YAMLSequenceRemapper::IsMergeablePath(path)) {
    const auto alignment = AlignLists(path, base, left, right);
    if (alignment && !FillsWhatMoved(*alignment) && !EditsWhatMoved(*alignment, base, left, right, settler)) {
      const size_t conflicts = settler.CountConflicts();
      OwnedNodePtr<YAMLSequence> merged = ListMerge(base, left, right, *alignment, settler).Merge();
      // Somebody looks at it anyway.
      if (settler.CountConflicts() > conflicts) return merged;
      if (IsSet(path) || IsMergeOfSlots(base, left, right, *merged, settler)) return merged;
    }
  }
  const ThreeValues lists = {&base, &left, &right};
  return CopyOf(lists.Get(settler.Decide(ConflictType::kBothChange, lists)));
}

}  // namespace vexel_yaml
