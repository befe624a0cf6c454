#include "scene/value_settler.h"

#include <optional>
#include <stdexcept>

#include "diff/mergeable_mapping.h"
#include "merge/replaced_path.h"
#include "rules/path_step.h"
#include "scene/merge_order.h"
#include "scene/same_fields.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

using Kind = YAMLNode::Kind;

// Whether two nodes are equal to the last character, or both null.
bool AreEqual(const YAMLNode* a, const YAMLNode* b) {
  return a == b || (a != nullptr && b != nullptr && a->HasSameContent(*b));
}

void SetAll(const ThreeMappings& versions, const YAMLScalar* key, const YAMLNode* value) {
  const OwnedNode kept = CopyOf(value);
  for (YAMLMapping* version : {&versions.base, &versions.left, &versions.right}) {
    SetEntry(*version, key, CopyOf(kept.get()).release());
  }
}

// Nothing where the engine can't line up the elements of some list.
std::optional<const Operation*> TryDiff(FieldPath& path, const YAMLNode* from, const YAMLNode* to) {
  try {
    return CreateDiffOperation(path, from, to);
  } catch (const std::length_error&) {
    return std::nullopt;
  }
}

bool AreAll(Kind kind, const ThreeValues& values) {
  const auto is_one = [&](const YAMLNode* node) { return node != nullptr && node->GetKind() == kind; };
  return is_one(values.base) && is_one(values.left) && is_one(values.right);
}

// Where all three versions have a mapping.
ThreeMappings MappingsAt(const ThreeMappings& versions, const YAMLScalar* key) {
  return {static_cast<YAMLMapping&>(versions.base.GetRef(key)),
          static_cast<YAMLMapping&>(versions.left.GetRef(key)),
          static_cast<YAMLMapping&>(versions.right.GetRef(key))};
}

ThreeValues ValuesAt(const ThreeMappings& versions, const YAMLScalar* key) {
  return {versions.base.Get(key), versions.left.Get(key), versions.right.Get(key)};
}

std::vector<const YAMLScalar*> KeysOf(const YAMLMapping& mapping) {
  std::vector<const YAMLScalar*> keys;
  keys.reserve(mapping.Size());
  for (const auto& [key, value] : mapping) keys.push_back(key);
  return keys;
}

// Puts the keys that stand in base into its order. Others keep their places.
void PutIntoOrder(const std::vector<const YAMLScalar*>& base, std::vector<const YAMLScalar*>& keys) {
  const std::unordered_set<const YAMLScalar*> all(keys.begin(), keys.end());
  const std::unordered_set<const YAMLScalar*> in_base(base.begin(), base.end());
  auto next = base.begin();
  for (const YAMLScalar*& key : keys) {
    if (!in_base.contains(key)) continue;
    while (!all.contains(*next)) ++next;
    key = *next++;
  }
}

}  // namespace

bool ValueSettler::AreSame(const YAMLNode* a, const YAMLNode* b) { return HaveSameFields(path_, a, b); }

MergeResolve ValueSettler::Decide(ConflictType type, const ThreeValues& values) {
  // The record outlives what the versions hold now.
  const auto operation_to = [&](const YAMLNode* value) -> const Operation* {
    const YAMLNode* kept = CopyOf(value).release();
    const std::optional<const Operation*> operation = TryDiff(path_, values.base, kept);
    return operation ? *operation : YAMLAlloc<ChangeOperation>::create(kept);
  };
  const Operation* left = operation_to(values.left);
  return resolver_.SettleConflict(path_, type, left, operation_to(values.right));
}

void ValueSettler::SettleEntries(const ThreeMappings& versions) {
  ThreeOrders<const YAMLScalar*> orders = {KeysOf(versions.base), KeysOf(versions.left),
                                           KeysOf(versions.right)};
  const bool is_everywhere_same = orders.base == orders.left && orders.base == orders.right;
  // Another order is no edit: where the other side did something, it is not taken.
  if (!is_everywhere_same && orders.left != orders.right && !AreEqual(&versions.base, &versions.left) &&
      !AreEqual(&versions.base, &versions.right)) {
    PutIntoOrder(orders.base, orders.left);
    PutIntoOrder(orders.base, orders.right);
  }
  std::unordered_set<const YAMLScalar*> settled;
  for (const auto* keys : {&orders.base, &orders.left, &orders.right}) {
    for (const YAMLScalar* key : *keys) {
      if (settled.insert(key).second) SettleEntry(versions, key);
    }
  }
  if (is_everywhere_same) return;
  const auto order = MergeOrder(orders, settled).order;
  for (YAMLMapping* version : {&versions.base, &versions.left, &versions.right}) version->Reorder(order);
}

void ValueSettler::SettleEntry(const ThreeMappings& versions, const YAMLScalar* key) {
  const PathStep step(path_, key);
  if (hands_off_(path_)) return;
  const ThreeValues values = ValuesAt(versions, key);
  if (AreEqual(values.base, values.left) && AreEqual(values.base, values.right)) return;
  if (AreMergedByField(values)) {
    SettleEntries(MappingsAt(versions, key));
  } else {
    SettleValue(versions, key, values);
  }
}

// As the engine sees it, but for a script that both sides replaced by the same one: it is settled with the
// other fields, and is no replacement then.
bool ValueSettler::AreMergedByField(const ThreeValues& values) {
  if (!AreAll(Kind::kMapping, values) || !YAMLSequenceRemapper::IsMergeablePath(path_)) return false;
  const YAMLMapping &base = *values.base->AsMapping(), &left = *values.left->AsMapping();
  const YAMLMapping& right = *values.right->AsMapping();
  if (base.HasDuplicateKeys() || left.HasDuplicateKeys() || right.HasDuplicateKeys()) return false;
  if (path_.size() == 2 && path_[1] == YAMLScalar::monoBehaviour &&
      !AreEqual(left.Get(YAMLScalar::mScript), right.Get(YAMLScalar::mScript))) {
    return false;
  }
  return IsMergeableMapping(path_, base, left) && IsMergeableMapping(path_, base, right);
}

void ValueSettler::SettleValue(const ThreeMappings& versions, const YAMLScalar* key,
                               const ThreeValues& values) {
  if (AreEqual(values.left, values.right)) return SetAll(versions, key, values.left);
  const bool left_edits = !AreSame(values.base, values.left);
  const bool right_edits = !AreSame(values.base, values.right);
  if (!left_edits || !right_edits) return SettleOneSided(versions, key, values, left_edits);
  if (AreSame(values.left, values.right)) return SetAll(versions, key, values.left);
  if (values.base == nullptr) {
    return SetAll(versions, key, MergeAdditions(*values.left, *values.right).get());
  }
  if (AreAll(Kind::kSequence, values)) return SetAll(versions, key, MergeLists(values).get());
  if (!IsEnginesConflict(values)) {
    SetAll(versions, key, values.Get(Decide(ConflictType::kBothChange, values)));
  }
}

// At least one side did no more than reorder fields, which must not meet what the other did.
void ValueSettler::SettleOneSided(const ThreeMappings& versions, const YAMLScalar* key,
                                  const ThreeValues& values, bool left_edits) {
  YAMLMapping& unedited = left_edits ? versions.right : versions.left;
  if (!AreEqual(values.base, unedited.Get(key))) SetEntry(unedited, key, CopyOf(values.base).release());
  SettleUnmatchable(versions, key, left_edits ? ConflictType::kLeftChanges : ConflictType::kRightChanges);
}

// Takes a one-sided edit of a list whose elements the engine can't line up as one change.
void ValueSettler::SettleUnmatchable(const ThreeMappings& versions, const YAMLScalar* key,
                                     ConflictType type) {
  const YAMLNode* base = versions.base.Get(key);
  const YAMLNode* edited = (IsLeftType(type) ? versions.left : versions.right).Get(key);
  if (base == nullptr || edited == nullptr || TryDiff(path_, base, edited)) return;
  if (base->AsMapping() != nullptr) {
    for (const YAMLScalar* entry : KeysOf(*edited->AsMapping())) {
      const PathStep step(path_, entry);
      SettleUnmatchable(MappingsAt(versions, key), entry, type);
    }
    return;
  }
  const auto* change = YAMLAlloc<ChangeOperation>::create(CopyOf(edited).release());
  const ReplacedPath place(resolver_, path_);
  SetAll(versions, key, resolver_.OnValueChanged(change, type) == nullptr ? base : edited);
}

// Whether the engine records a conflict by itself where both sides changed a value, and fails on none of
// them.
bool ValueSettler::IsEnginesConflict(const ThreeValues& values) {
  if (values.left == nullptr || values.right == nullptr) return false;
  const auto is_replaced = [&](const YAMLNode* value) {
    return value->AsScalar() != nullptr || value->GetKind() != values.base->GetKind();
  };
  if (is_replaced(values.left) != is_replaced(values.right)) return false;
  if (is_replaced(values.left)) return true;
  const std::optional<const Operation*> left = TryDiff(path_, values.base, values.left);
  const std::optional<const Operation*> right = TryDiff(path_, values.base, values.right);
  return left && right && *left != nullptr && *right != nullptr && !OperationEquals(**left, **right);
}

OwnedNode ValueSettler::MergeLists(const ThreeValues& lists) {
  return vexel_yaml::MergeLists(*lists.base->AsSequence(), *lists.left->AsSequence(),
                                *lists.right->AsSequence(), *this);
}

OwnedNode ValueSettler::MergeAdditions(const YAMLNode& left, const YAMLNode& right) {
  if (hands_off_(path_) || AreSame(&left, &right)) return CopyOf(&left);
  const YAMLMapping *left_mapping = left.AsMapping(), *right_mapping = right.AsMapping();
  if (left_mapping != nullptr && right_mapping != nullptr && YAMLSequenceRemapper::IsMergeablePath(path_) &&
      IsMergeableMapping(path_, *left_mapping, *right_mapping) &&
      IsMergeableMapping(path_, *right_mapping, *left_mapping)) {
    return MergeAddedMappings(*left_mapping, *right_mapping);
  }
  const MergeResolve side = Decide(ConflictType::kBothAdd, {nullptr, &left, &right});
  return CopyOf(side == MergeResolve::kRight ? &right : &left);
}

OwnedNode ValueSettler::MergeAddedMappings(const YAMLMapping& left, const YAMLMapping& right) {
  const ThreeOrders<const YAMLScalar*> orders = {{}, KeysOf(left), KeysOf(right)};
  std::unordered_set<const YAMLScalar*> keys(orders.left.begin(), orders.left.end());
  keys.insert(orders.right.begin(), orders.right.end());
  OwnedNodePtr<YAMLMapping> merged(YAMLAlloc<YAMLMapping>::create(left.IsFlow()));
  for (const YAMLScalar* key : MergeOrder(orders, keys).order) {
    const PathStep step(path_, key);
    const YAMLNode *a = left.Get(key), *b = right.Get(key);
    const bool are_both = a != nullptr && b != nullptr;
    merged->Insert(key, (are_both ? MergeAdditions(*a, *b) : CopyOf(a != nullptr ? a : b)).release());
  }
  return merged;
}

OwnedNode ValueSettler::MergeElement(const ThreeValues& element, const YAMLScalar* index) {
  const auto holder_of = [&](const YAMLNode* value) {
    OwnedNodePtr<YAMLMapping> holder(YAMLAlloc<YAMLMapping>::create(false));
    holder->Insert(index, CopyOf(value).release());
    return holder;
  };
  const OwnedNodePtr<YAMLMapping> base = holder_of(element.base);
  // Never given back: records may name what is in them.
  YAMLMapping* left = holder_of(element.left).release();
  YAMLMapping* right = holder_of(element.right).release();
  SettleEntry({*base, *left, *right}, index);
  for (YAMLMapping* version : {base.get(), left, right}) version->RebuildHash(false);

  const PathStep step(path_, index);
  const Operation* left_edit = CreateDiffOperation(path_, base->Get(index), left->Get(index));
  const Operation* right_edit = CreateDiffOperation(path_, base->Get(index), right->Get(index));
  const ReplacedPath place(resolver_, path_);
  const Operation* merged = Operation::Merge(left_edit, right_edit, resolver_);
  if (merged != nullptr) merged->Apply(*base, index);
  return OwnedNode(base->Steal(index));
}

}  // namespace vexel_yaml
