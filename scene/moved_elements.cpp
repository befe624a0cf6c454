#include "scene/moved_elements.h"

#include <algorithm>

#include "rules/path_step.h"

namespace vexel_yaml {

namespace {

// Where so many came and went, nobody can tell what became of which.
constexpr size_t kMostCompared = 1'000'000;

bool Moves(const ListAlignment& alignment, uint32_t AlignedElement::*side,
           bool AlignedElement::*is_replaced_by_other) {
  std::vector<const AlignedElement*> kept;
  for (const AlignedElement& element : alignment.elements) {
    if (element.base != kNoIndex && element.*side != kNoIndex) kept.push_back(&element);
  }
  std::vector<uint32_t> first_behind(kept.size() + 1, kNoIndex);
  for (size_t i = kept.size(); i-- > 0;) first_behind[i] = std::min(first_behind[i + 1], kept[i]->*side);
  uint32_t last_before = 0;
  for (size_t i = 0; i < kept.size(); ++i) {
    const uint32_t index = kept[i]->*side;
    const bool is_moved = index < last_before || index > first_behind[i + 1];
    if (is_moved && kept[i]->*is_replaced_by_other) return true;
    last_before = std::max(last_before, index);
  }
  return false;
}

// Whether at least half of an element's fields are as they were. What refers to something else is another
// element.
bool MayBeEditOf(const YAMLNode* before, const YAMLNode* after, ValueSettler& settler) {
  const YAMLMapping *a = before->AsMapping(), *b = after->AsMapping();
  if (a == nullptr || b == nullptr || a->HasDuplicateKeys() || b->HasDuplicateKeys()) return false;
  if (a->Size() == 0 || a->HasKey(YAMLScalar::fileID)) return false;
  size_t same = 0;
  for (const auto& [key, value] : *a) {
    const PathStep step(settler.GetPath(), key);
    if (settler.AreSame(value, b->Get(key))) ++same;
  }
  return 2 * same >= a->Size();
}

}  // namespace

bool FillsWhatMoved(const ListAlignment& alignment) {
  return Moves(alignment, &AlignedElement::left, &AlignedElement::is_replaced_by_right) ||
         Moves(alignment, &AlignedElement::right, &AlignedElement::is_replaced_by_left);
}

bool EditsWhatMoved(const ListAlignment& alignment, const YAMLSequence& base, const YAMLSequence& left,
                    const YAMLSequence& right, ValueSettler& settler) {
  if (alignment.has_keys) return false;
  std::vector<const YAMLNode*> gone;
  std::vector<const YAMLNode*> came;
  for (const AlignedElement& element : alignment.elements) {
    const bool in_left = element.left != kNoIndex, in_right = element.right != kNoIndex;
    if (element.base != kNoIndex) {
      if (!in_left && !in_right) gone.push_back(base.GetItems()[element.base]);
    } else if (in_left != in_right) {
      came.push_back(in_left ? left.GetItems()[element.left] : right.GetItems()[element.right]);
    }
  }
  if (!came.empty() && gone.size() > kMostCompared / came.size()) return true;
  const PathStep step(settler.GetPath(), YAMLScalar::star);
  return std::ranges::any_of(gone, [&](const YAMLNode* before) {
    return std::ranges::any_of(came,
                               [&](const YAMLNode* after) { return MayBeEditOf(before, after, settler); });
  });
}

}  // namespace vexel_yaml
