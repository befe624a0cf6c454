#include "yaml/yaml_sequence.h"

#include <utility>

#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

YAMLSequence::~YAMLSequence() { ResetForAlloc(); }

YAMLNode* YAMLSequence::Get(int index) const {
  if (index < 0 || static_cast<size_t>(index) >= items_.size()) {
    throw YAMLError("Cannot get non existing index in YAMLSequence");
  }
  return items_[static_cast<size_t>(index)];
}

YAMLNode* YAMLSequence::Set(int index, YAMLNode* node) {
  if (index < 0 || static_cast<size_t>(index) >= items_.size()) {
    throw YAMLError("Cannot change non existing index in YAMLSequence");
  }
  return std::exchange(items_[static_cast<size_t>(index)], node);
}

void YAMLSequence::Place(int index, YAMLNode* node) {
  if (index >= 0 && static_cast<size_t>(index) >= items_.size())
    items_.resize(static_cast<size_t>(index) + 1);
  if (YAMLNode* old = Set(index, node)) old->Free();
}

std::vector<YAMLNode*> YAMLSequence::SwapItems(std::vector<YAMLNode*> items) {
  return std::exchange(items_, std::move(items));
}

YAMLSequence* YAMLSequence::StaticClone() const {
  OwnedNodePtr<YAMLSequence> clone(YAMLAlloc<YAMLSequence>::create(flow_));
  clone->Reserve(items_.size());
  for (const YAMLNode* item : items_) clone->Append(item == nullptr ? nullptr : item->Clone());
  clone->SetHash(GetHash());
  clone->SetLine(GetLine());
  return clone.release();
}

void YAMLSequence::Free() { YAMLAlloc<YAMLSequence>::free(this); }

bool YAMLSequence::Equals(const YAMLNode* other) const {
  if (other != nullptr && GetHash() != 0 && other->GetHash() != 0) return GetHash() == other->GetHash();
  return EqualsExpensive(other);
}

bool YAMLSequence::EqualsExpensive(const YAMLNode* other) const {
  const YAMLSequence* sequence = other == nullptr ? nullptr : other->AsSequence();
  if (sequence == nullptr || sequence->items_.size() != items_.size()) return false;
  for (size_t i = 0; i < items_.size(); ++i) {
    const YAMLNode* a = items_[i];
    const YAMLNode* b = sequence->items_[i];
    if (a == nullptr || b == nullptr ? a != b : !a->EqualsExpensive(b)) return false;
  }
  return true;
}

void YAMLSequence::ResetForAlloc() {
  for (YAMLNode* item : items_) {
    if (item != nullptr) item->Free();
  }
  items_.clear();
}

void YAMLSequence::RebuildHash(bool shallow) {
  uint32_t hash = 0;
  for (size_t i = 0; i < items_.size(); ++i) {
    if (!shallow && items_[i] != nullptr) items_[i]->RebuildHash(false);
    const uint32_t item_hash = items_[i] == nullptr ? 0 : items_[i]->GetHash();
    hash = Combine(Combine(hash, item_hash), static_cast<uint32_t>(i));
  }
  SetHash(hash);
}

}  // namespace vexel_yaml
