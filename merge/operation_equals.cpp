#include <algorithm>

#include "diff/merge_tree_visitor.h"

namespace vexel_yaml {

namespace {

// Two values with one hash are probably equal. Whoever drops one of two edits must know it.
bool ValuesEqual(const ValuedOperation& a, const ValuedOperation& b) {
  return a.GetValue()->Equals(b.GetValue()) && a.GetValue()->HasSameContent(*b.GetValue());
}

bool AreEqual(const RemoveOperation& /*a*/, const RemoveOperation& /*b*/) { return true; }
bool AreEqual(const ChangeOperation& a, const ChangeOperation& b) { return ValuesEqual(a, b); }
bool AreEqual(const AddOperation& a, const AddOperation& b) { return ValuesEqual(a, b); }

bool AreEqual(const ChangeMappingOperation& a, const ChangeMappingOperation& b) {
  const auto entries_equal = [](const YAMLMappingDiff::Entry& x, const YAMLMappingDiff::Entry& y) {
    return x.key == y.key && x.index == y.index && OperationEquals(*x.operation, *y.operation);
  };
  if (!std::ranges::equal(a.GetDiff()->GetEntries(), b.GetDiff()->GetEntries(), entries_equal)) return false;
  const ChangeSequenceOperation* a_order = a.GetDiff()->GetKeyOrder();
  const ChangeSequenceOperation* b_order = b.GetDiff()->GetKeyOrder();
  if (a_order == b_order) return true;
  return a_order != nullptr && b_order != nullptr && OperationEquals(*a_order, *b_order);
}

// The layouts don't count: what a side only moves or drops is no difference here.
bool AreEqual(const ChangeSequenceOperation& a, const ChangeSequenceOperation& b) {
  return std::ranges::equal(a.GetDiff()->GetEntries(), b.GetDiff()->GetEntries(),
                            [](const auto& x, const auto& y) {
                              return x.first == y.first && OperationEquals(*x.second, *y.second);
                            });
}

// Visits the second operation, once the first one's kind is known.
template <typename First>
class OperationComparer2nd final : public MergeTreeVisitor {
 public:
  explicit OperationComparer2nd(const First& first) : first_(first) {}

  using MergeTreeVisitor::Visit;
  void Visit(const RemoveOperation* second) override { Compare(*second); }
  void Visit(const ChangeOperation* second) override { Compare(*second); }
  void Visit(const AddOperation* second) override { Compare(*second); }
  void Visit(const ChangeMappingOperation* second) override { Compare(*second); }
  void Visit(const ChangeSequenceOperation* second) override { Compare(*second); }

  bool AreEqual() const { return equal_; }

 private:
  template <typename Second>
  void Compare(const Second& second) {
    if constexpr (std::is_same_v<First, Second>) {
      equal_ = vexel_yaml::AreEqual(first_, second);
    } else {
      equal_ = false;
    }
  }

  const First& first_;
  bool equal_ = true;
};

// Visits the first operation.
class OperationComparer final : public MergeTreeVisitor {
 public:
  explicit OperationComparer(const Operation& second) : second_(second) {}

  using MergeTreeVisitor::Visit;
  void Visit(const RemoveOperation* first) override { Compare(*first); }
  void Visit(const ChangeOperation* first) override { Compare(*first); }
  void Visit(const AddOperation* first) override { Compare(*first); }
  void Visit(const ChangeMappingOperation* first) override { Compare(*first); }
  void Visit(const ChangeSequenceOperation* first) override { Compare(*first); }

  bool AreEqual() const { return equal_; }

 private:
  template <typename First>
  void Compare(const First& first) {
    OperationComparer2nd<First> comparer(first);
    second_.Accept(comparer);
    equal_ = comparer.AreEqual();
  }

  const Operation& second_;
  bool equal_ = true;
};

}  // namespace

bool OperationEquals(const Operation& a, const Operation& b) {
  OperationComparer comparer(b);
  a.Accept(comparer);
  return comparer.AreEqual();
}

}  // namespace vexel_yaml
