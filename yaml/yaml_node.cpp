#include "yaml/yaml_node.h"

#include <algorithm>

#include "yaml/folded_object.h"
#include "yaml/yaml_mapping.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

bool SlotsHaveSameContent(const YAMLMapping::Slot& a, const YAMLMapping::Slot& b) {
  return a.key == b.key && a.value->HasSameContent(*b.value);
}

bool ItemsHaveSameContent(const YAMLNode* a, const YAMLNode* b) {
  return a == b || (a != nullptr && b != nullptr && a->HasSameContent(*b));
}

}  // namespace

bool YAMLNode::HasSameContent(const YAMLNode& other) const {
  if (this == &other) return true;
  if (kind_ != other.kind_) return false;
  if (HaveSameText(*this, other)) return true;
  switch (kind_) {
    case Kind::kScalar:
      return false;  // Interned: another scalar is another text.
    case Kind::kMapping: {
      const YAMLMapping& a = *AsMapping();
      const YAMLMapping& b = *other.AsMapping();
      if (a.HasDuplicateKeys() || b.HasDuplicateKeys()) {
        return std::ranges::equal(a.GetDuplicatePairs(), b.GetDuplicatePairs(), SlotsHaveSameContent);
      }
      return a.Size() == b.Size() && std::equal(a.begin(), a.end(), b.begin(), SlotsHaveSameContent);
    }
    case Kind::kSequence:
      return std::ranges::equal(AsSequence()->GetItems(), other.AsSequence()->GetItems(),
                                ItemsHaveSameContent);
  }
  return false;
}

}  // namespace vexel_yaml
