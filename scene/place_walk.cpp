#include "scene/place_walk.h"

namespace vexel_yaml {

void PlaceWalk::Walk(const YAMLScalar* file_id, const YAMLNode* base, YAMLNode* deleter, YAMLNode* other) {
  if (!Refers(base) && !Refers(other)) return;
  path_ = {file_id};
  kind_ = ReadLinks(base).kind;
  WalkNodes(base, deleter, other);
}

void PlaceWalk::WalkNodes(const YAMLNode* base, YAMLNode* deleter, YAMLNode* other) {
  if (base == nullptr || deleter == nullptr || base->GetKind() != deleter->GetKind()) return;
  if (other != nullptr && other->GetKind() != base->GetKind()) other = nullptr;
  if (base->AsMapping() != nullptr) {
    WalkMappings(*base->AsMapping(), *deleter->AsMapping(), other == nullptr ? nullptr : other->AsMapping());
  } else if (base->AsSequence() != nullptr) {
    WalkLists(*base->AsSequence(), *deleter->AsSequence(), other == nullptr ? nullptr : other->AsSequence());
  }
}

void PlaceWalk::WalkMappings(const YAMLMapping& base, YAMLMapping& deleter, YAMLMapping* other) {
  if (base.HasDuplicateKeys() || deleter.HasDuplicateKeys()) return;
  if (other != nullptr && other->HasDuplicateKeys()) other = nullptr;
  if (GetLocalTarget(&base) != nullptr) return on_field_(base, deleter, other);
  for (const auto& [key, value] : base) {
    path_.push_back(key);
    if (!IsLink(path_, kind_)) {
      WalkNodes(value, deleter.Get(key), other == nullptr ? nullptr : other->Get(key));
    }
    path_.pop_back();
  }
}

void PlaceWalk::WalkLists(const YAMLSequence& base, YAMLSequence& deleter, YAMLSequence* other) {
  // To align lists takes far longer than to look for references.
  if (!Refers(&base) && !Refers(other)) return;
  const std::optional<ListAlignment> alignment =
      AlignLists(path_, base, deleter, other == nullptr ? base : *other);
  if (!alignment) return;
  for (const AlignedElement& element : alignment->elements) {
    if (element.base == kNoIndex || element.left == kNoIndex) continue;
    path_.push_back(YAMLScalar::Lookup(IntToString(static_cast<int>(element.base))));
    WalkNodes(base.GetItems()[element.base], deleter.GetItems()[element.left],
              other == nullptr || element.right == kNoIndex ? nullptr : other->GetItems()[element.right]);
    path_.pop_back();
  }
  on_list_({base, deleter, other, alignment->elements, path_});
}

bool PlaceWalk::Refers(const YAMLNode* node) const {
  bool refers = false;
  VisitReferences(const_cast<YAMLNode*>(node),
                  [&](YAMLMapping& reference) { refers |= is_sought_(GetLocalTarget(&reference)); });
  return refers;
}

const YAMLScalar* TargetOf(const YAMLNode* entry, const IsSought& is_sought) {
  const auto sought = [&](const YAMLNode* value) {
    const YAMLScalar* target = GetLocalTarget(value);
    return target != nullptr && is_sought(target) ? target : nullptr;
  };
  if (const YAMLScalar* target = sought(entry)) return target;
  const YAMLMapping* mapping = entry == nullptr ? nullptr : entry->AsMapping();
  static const YAMLScalar* const property_path = YAMLScalar::Lookup("propertyPath");
  if (mapping == nullptr || mapping->HasKey(property_path)) return nullptr;
  for (const auto& [key, value] : *mapping) {
    if (const YAMLScalar* target = sought(value)) return target;
  }
  return nullptr;
}

bool IsAnotherReference(const YAMLNode* before, const YAMLNode* now) {
  const YAMLScalar* target = GetLocalTarget(before);
  return target != nullptr && target != GetLocalTarget(now);
}

}  // namespace vexel_yaml
