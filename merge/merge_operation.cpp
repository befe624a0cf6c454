#include "merge/conflict_resolver.h"

namespace vexel_yaml {

namespace {

using Kind = Operation::Kind;

// The operation as the kind T where it is of that kind, else null.
template <typename T>
const T* As(const Operation* operation, Kind kind) {
  return operation != nullptr && operation->GetKind() == kind ? static_cast<const T*>(operation) : nullptr;
}

// One side's operation, as each kind it could be.
struct Side {
  explicit Side(const Operation* operation)
      : remove(As<RemoveOperation>(operation, Kind::kRemove)),
        change(As<ChangeOperation>(operation, Kind::kChange)),
        add(As<AddOperation>(operation, Kind::kAdd)),
        mapping(As<ChangeMappingOperation>(operation, Kind::kChangeMapping)),
        sequence(As<ChangeSequenceOperation>(operation, Kind::kChangeSequence)) {}

  const RemoveOperation* remove;
  const ChangeOperation* change;
  const AddOperation* add;
  const ChangeMappingOperation* mapping;
  const ChangeSequenceOperation* sequence;
};

}  // namespace

// The order of the rows is the decision: a removal on the right wins over whatever the left did, and a
// wholesale change or an addition wins over a nested edit, while a removal on the left meets an edit on the
// right as a conflict.
const Operation* Operation::Merge(const Operation* left_operation, const Operation* right_operation,
                                  ConflictResolver& resolver) {
  const Side left(left_operation);
  const Side right(right_operation);
  if (left.remove && right.remove) return resolver.OnSameValueRemoved(left.remove, right.remove);
  if (right.remove) return resolver.OnValueRemoved(right.remove, ConflictType::kRightRemoves);
  if (left.remove && right.change) return resolver.OnSameValueChanged(left.remove, right.change);
  if (left.remove && right.mapping) return resolver.OnSameValueChanged(left.remove, right.mapping);
  if (left.remove) return resolver.OnValueRemoved(left.remove, ConflictType::kLeftRemoves);
  if (left.change && right.change) return resolver.OnSameValueChanged(left.change, right.change);
  if (right.change) return resolver.OnValueChanged(right.change, ConflictType::kRightChanges);
  if (left.change) return resolver.OnValueChanged(left.change, ConflictType::kLeftChanges);
  if (left.add && right.add) return resolver.OnSameValueAdded(left.add, right.add);
  if (right.add) return resolver.OnValueAdded(right.add, ConflictType::kRightAdds);
  if (left.add) return resolver.OnValueAdded(left.add, ConflictType::kLeftAdds);
  if (left.mapping && right.mapping) return resolver.OnSameMappingChanged(left.mapping, right.mapping);
  if (left.mapping) return resolver.OnMappingChanged(left.mapping, ConflictType::kLeftChanges);
  if (right.mapping) return resolver.OnMappingChanged(right.mapping, ConflictType::kRightChanges);
  if (left.sequence && right.sequence) return resolver.OnSameSequenceChanged(left.sequence, right.sequence);
  if (left.sequence) return resolver.OnSequenceChanged(left.sequence, ConflictType::kLeftChanges);
  if (right.sequence) return resolver.OnSequenceChanged(right.sequence, ConflictType::kRightChanges);
  return nullptr;
}

}  // namespace vexel_yaml
