#include <algorithm>

#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"

namespace vexel_yaml {

namespace {

bool ValuesEqual(const Operation& a, const Operation& b) {
  return static_cast<const ValuedOperation&>(a).GetValue()->Equals(
      static_cast<const ValuedOperation&>(b).GetValue());
}

bool SequenceDiffsEqual(const YAMLSequenceDiff& a, const YAMLSequenceDiff& b) {
  return std::equal(a.GetEntries().begin(), a.GetEntries().end(), b.GetEntries().begin(),
                    b.GetEntries().end(), [](const auto& x, const auto& y) {
                      return x.first == y.first && OperationEquals(*x.second, *y.second);
                    });
}

// Two removals or two moves have nothing but the layout to tell them apart.
bool LayoutsEqual(const YAMLSequenceRemapper* a, const YAMLSequenceRemapper* b) {
  if (a == nullptr || b == nullptr) return a == b;
  return a->GetDestinationCount() == b->GetDestinationCount() && a->GetMapping() == b->GetMapping();
}

bool ChangeSequencesEqual(const ChangeSequenceOperation& a, const ChangeSequenceOperation& b) {
  return LayoutsEqual(a.GetRemapper(), b.GetRemapper()) && SequenceDiffsEqual(*a.GetDiff(), *b.GetDiff());
}

bool MappingDiffsEqual(const YAMLMappingDiff& a, const YAMLMappingDiff& b) {
  const auto entries_equal = [](const YAMLMappingDiff::Entry& x, const YAMLMappingDiff::Entry& y) {
    return x.key == y.key && x.index == y.index && OperationEquals(*x.operation, *y.operation);
  };
  if (!std::equal(a.GetEntries().begin(), a.GetEntries().end(), b.GetEntries().begin(), b.GetEntries().end(),
                  entries_equal)) {
    return false;
  }
  const ChangeSequenceOperation* a_order = a.GetKeyOrder();
  const ChangeSequenceOperation* b_order = b.GetKeyOrder();
  if (a_order == b_order) return true;
  return a_order != nullptr && b_order != nullptr && OperationEquals(*a_order, *b_order);
}

}  // namespace

bool OperationEquals(const Operation& a, const Operation& b) {
  if (a.GetKind() != b.GetKind()) return false;
  switch (a.GetKind()) {
    case Operation::Kind::kRemove:
      return true;
    case Operation::Kind::kChange:
    case Operation::Kind::kAdd:
      return ValuesEqual(a, b);
    case Operation::Kind::kChangeMapping:
      return MappingDiffsEqual(*static_cast<const ChangeMappingOperation&>(a).GetDiff(),
                               *static_cast<const ChangeMappingOperation&>(b).GetDiff());
    case Operation::Kind::kChangeSequence:
      return ChangeSequencesEqual(static_cast<const ChangeSequenceOperation&>(a),
                                  static_cast<const ChangeSequenceOperation&>(b));
  }
  return false;
}

}  // namespace vexel_yaml
