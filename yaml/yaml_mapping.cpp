#include "yaml/yaml_mapping.h"

#include <algorithm>
#include <array>
#include <cstdint>

#include "yaml/folded_object.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

constexpr size_t kIndexFrom = 16;
constexpr size_t kNotFound = static_cast<size_t>(-1);

// Keys are interned: the address is the text.
uint64_t HashOf(const YAMLScalar* key) { return reinterpret_cast<uintptr_t>(key); }

}  // namespace

YAMLMapping::~YAMLMapping() { Clear(); }

void YAMLMapping::ReadFolded() const {
  // A lock for each mapping would cost more memory than the few that two threads ask for at once are worth.
  static std::array<Mutex, 64> mutexes;
  AutoLock lock(mutexes[(reinterpret_cast<uintptr_t>(this) / sizeof(YAMLMapping)) % mutexes.size()]);
  const FoldedObject* folded = GetFolded();
  if (folded == nullptr) return;
  OwnedNodePtr<YAMLMapping> read(folded->Read());
  auto& self = const_cast<YAMLMapping&>(*this);
  self.slots_ = std::exchange(read->slots_, {});
  self.SetHash(read->GetHash());
  self.SetLine(read->GetLine());
  self.BuildIndex();
  // The others may look at the content once they see this.
  folded_.store(nullptr, std::memory_order_release);
}

void YAMLMapping::RefuseDuplicates() const {
  Unfold();
  if (duplicates_) throw YAMLError("Cannot perform this operation on a YAML file with duplicate keys");
}

size_t YAMLMapping::FindSlot(const YAMLScalar* key) const {
  if (index_) {
    // Of a slot that has gone, or has another key now, the entry stays.
    const uint32_t found = index_->Find(
        HashOf(key), [&](uint32_t slot) { return slot < slots_.size() && slots_[slot].key == key; });
    return found == PositionIndex::kNone ? kNotFound : found;
  }
  const auto found =
      std::find_if(slots_.begin(), slots_.end(), [&](const Slot& slot) { return slot.key == key; });
  return found == slots_.end() ? kNotFound : static_cast<size_t>(found - slots_.begin());
}

YAMLNode* YAMLMapping::Find(const YAMLScalar* key) const {
  // All but the body is known.
  if (const FoldedObject* folded = GetFolded(); folded != nullptr && key != folded->body_key) {
    const YAMLScalar* value = folded->GetPseudoValue(key);
    return value == nullptr ? nullptr : value->AsValue();
  }
  RefuseDuplicates();
  const size_t slot = FindSlot(key);
  return slot == kNotFound ? nullptr : slots_[slot].value;
}

void YAMLMapping::BuildIndex() {
  index_.reset();
  if (slots_.size() < kIndexFrom) return;
  // With room to spare: renaming a key leaves an entry behind.
  index_ = std::make_unique<PositionIndex>(slots_.capacity() + slots_.size() / 4);
  for (size_t i = 0; i < slots_.size(); ++i) {
    if (slots_[i].key != nullptr) index_->Insert(HashOf(slots_[i].key), static_cast<uint32_t>(i));
  }
}

void YAMLMapping::IndexSlot(size_t slot) {
  if (index_ != nullptr && !index_->IsFull()) {
    index_->Insert(HashOf(slots_[slot].key), static_cast<uint32_t>(slot));
  } else if (index_ != nullptr || slots_.size() >= kIndexFrom) {
    BuildIndex();
  }
}

void YAMLMapping::AddSlot(const YAMLScalar* key, YAMLNode* value) {
  slots_.push_back({key, value});
  IndexSlot(slots_.size() - 1);
}

void YAMLMapping::Append(const YAMLScalar* key, YAMLNode* value) {
  Unfold();
  if (duplicates_) {
    duplicates_->push_back({key, value});
    return;
  }
  const size_t present = FindSlot(key);
  if (present == kNotFound) {
    AddSlot(key, value);
  } else if (!slots_[present].value->EqualsByContent(value)) {
    StartDuplicates(key, value);
  }
}

void YAMLMapping::AppendRepeated(const YAMLScalar* key, YAMLNode* value) {
  Unfold();
  if (!duplicates_ && FindSlot(key) != kNotFound) {
    StartDuplicates(key, value);
  } else {
    Append(key, value);
  }
}

void YAMLMapping::StartDuplicates(const YAMLScalar* key, YAMLNode* value) {
  CloseGaps();
  auto duplicates = std::make_unique<std::vector<Slot>>();
  duplicates->reserve(slots_.size() + 1);
  duplicates->assign(slots_.begin(), slots_.end());
  duplicates->push_back({key, value});
  duplicates_ = std::move(duplicates);
  slots_.clear();
  index_.reset();
}

void YAMLMapping::Insert(const YAMLScalar* key, YAMLNode* value) {
  Unfold();
  if (HasKey(key)) throw YAMLError("Cannot add existing key in YAMLMapping");
  AddSlot(key, value);
}

YAMLNode* YAMLMapping::Change(const YAMLScalar* key, YAMLNode* value) {
  RefuseDuplicates();
  const size_t slot = FindSlot(key);
  if (slot == kNotFound) throw YAMLError("Cannot change non existing key in YAMLMapping");
  return std::exchange(slots_[slot].value, value);
}

void YAMLMapping::ChangeKey(const YAMLScalar* old_key, const YAMLScalar* new_key) {
  RefuseDuplicates();
  const size_t slot = FindSlot(old_key);
  if (slot == kNotFound) throw YAMLError("Cannot change key of non existing key in YAMLMapping");
  if (old_key == new_key) return;
  const size_t existing = FindSlot(new_key);
  if (existing != kNotFound) {
    slots_[slot].value->Free();
    slots_[slot].value = slots_[existing].value;
    slots_[existing] = {nullptr, nullptr};
    ++gaps_;
  }
  slots_[slot].key = new_key;
  IndexSlot(slot);
}

YAMLNode& YAMLMapping::GetRef(const YAMLScalar* key) {
  YAMLNode* value = Find(key);
  if (value == nullptr) throw YAMLError("Cannot get unknown key from yaml mapping");
  return *value;
}

YAMLNode* YAMLMapping::Steal(const YAMLScalar* key) {
  RefuseDuplicates();
  const size_t slot = FindSlot(key);
  if (slot == kNotFound) return nullptr;
  YAMLNode* value = slots_[slot].value;
  if (slot + 1 == slots_.size()) {
    slots_.pop_back();
    return value;
  }
  // Leaves a gap: closing it at once would move every later pair, for each of many removed objects.
  slots_[slot] = {nullptr, nullptr};
  ++gaps_;
  if (gaps_ > slots_.size() / 2) CloseGaps();
  return value;
}

void YAMLMapping::Remove(const YAMLScalar* key) {
  if (YAMLNode* value = Steal(key)) value->Free();
}

void YAMLMapping::CloseGaps() {
  if (gaps_ == 0) return;
  std::erase_if(slots_, [](const Slot& slot) { return slot.key == nullptr; });
  gaps_ = 0;
  BuildIndex();
}

size_t YAMLMapping::Size() const {
  RefuseDuplicates();
  return slots_.size() - gaps_;
}

YAMLMapping::Iterator YAMLMapping::begin() const {
  RefuseDuplicates();
  const Slot* end = slots_.data() + slots_.size();
  return {slots_.data(), end};
}

YAMLMapping::Iterator YAMLMapping::end() const {
  RefuseDuplicates();
  const Slot* end = slots_.data() + slots_.size();
  return {end, end};
}

const YAMLScalar* YAMLMapping::FirstKey() const {
  const FoldedObject* folded = GetFolded();
  return folded != nullptr ? folded->body_key : (*begin()).key;
}

void YAMLMapping::Reorder(const std::vector<const YAMLScalar*>& order) {
  RefuseDuplicates();
  std::vector<Slot> reordered;
  reordered.reserve(order.size());
  std::vector<bool> placed(slots_.size(), false);
  for (const YAMLScalar* key : order) {
    const size_t slot = FindSlot(key);
    if (slot == kNotFound || placed[slot]) continue;
    placed[slot] = true;
    reordered.push_back(slots_[slot]);
  }
  if (reordered.size() != Size()) throw YAMLError("Unmapped key when trying to reorder mapping keys");
  slots_ = std::move(reordered);
  gaps_ = 0;
  BuildIndex();
}

YAMLSequence* YAMLMapping::ToSequence() const {
  Unfold();
  OwnedNodePtr<YAMLSequence> sequence(YAMLAlloc<YAMLSequence>::create(flow_));
  const auto append = [&](const Slot& slot) {
    OwnedNodePtr<YAMLMapping> pair(YAMLAlloc<YAMLMapping>::create(false));
    pair->slots_.reserve(1);
    pair->slots_.push_back({slot.key, slot.value->Clone()});
    sequence->Append(pair.get());
    pair.release();
  };
  if (duplicates_) {
    for (const Slot& slot : *duplicates_) append(slot);
  } else {
    for (const Slot& slot : *this) append(slot);
  }
  return sequence.release();
}

void YAMLMapping::Clear() {
  folded_.store(nullptr, std::memory_order_relaxed);
  for (const Slot& slot : slots_) {
    if (slot.value != nullptr) slot.value->Free();
  }
  slots_.clear();
  gaps_ = 0;
  index_.reset();
  if (!duplicates_) return;
  for (const Slot& slot : *duplicates_) slot.value->Free();
  duplicates_->clear();
}

void YAMLMapping::CloneInto(YAMLMapping& target) const {
  target.SetFlow(flow_);
  target.SetLine(GetLine());
  // Before the content is looked at, which another thread may be reading.
  if (const FoldedObject* folded = GetFolded()) {
    target.Fold(*folded);
    return;
  }
  target.SetHash(GetHash());
  target.slots_.reserve(slots_.size());
  for (const Slot& slot : slots_) {
    if (slot.key == nullptr) continue;
    // Most values are scalars, which are their own copies.
    target.slots_.push_back({slot.key, slot.value->AsScalar() ? slot.value : slot.value->Clone()});
  }
  target.BuildIndex();
}

std::vector<YAMLMapping::Slot> YAMLMapping::TakePairs() {
  Unfold();
  CloseGaps();
  std::vector<Slot> pairs = duplicates_ ? std::move(*duplicates_) : std::move(slots_);
  ForgetPairs();
  return pairs;
}

void YAMLMapping::ForgetPairs() {
  folded_.store(nullptr, std::memory_order_relaxed);
  slots_.clear();
  gaps_ = 0;
  index_.reset();
  duplicates_.reset();
}

const std::vector<YAMLMapping::Slot>& YAMLMapping::GetDuplicatePairs() const {
  static const std::vector<Slot> none;
  return duplicates_ ? *duplicates_ : none;
}

void YAMLMapping::Free() { YAMLAlloc<YAMLMapping>::free(this); }

YAMLMapping* YAMLMapping::Clone() const {
  OwnedNodePtr<YAMLMapping> clone(YAMLAlloc<YAMLMapping>::create(flow_));
  CloneInto(*clone);
  return clone.release();
}

bool YAMLMapping::Equals(const YAMLNode* other) const {
  if (other != nullptr && HaveSameText(*this, *other)) return true;
  Unfold();
  if (vexel_yaml::GetFolded(other) != nullptr) other->AsMapping()->Unfold();
  if (other != nullptr && GetHash() != 0 && other->GetHash() != 0) return GetHash() == other->GetHash();
  return EqualsExpensive(other);
}

bool YAMLMapping::EqualsExpensive(const YAMLNode* other) const {
  const YAMLMapping* mapping = other == nullptr ? nullptr : other->AsMapping();
  if (mapping == nullptr) return false;
  if (duplicates_ || mapping->duplicates_) return HasSameContent(*mapping);
  if (mapping->Size() != Size()) return false;
  // Only the keys are compared: with interned keys this mapping's own values would be compared with
  // themselves, and values are the business of the hash.
  Iterator other_slot = mapping->begin();
  for (const Slot& slot : *this) {
    if (slot.key != (*other_slot).key) return false;
    ++other_slot;
  }
  return true;
}

void YAMLMapping::RebuildHash(bool shallow) {
  uint32_t hash = 0;
  uint32_t position = 0;
  for (const Slot& slot : *this) {
    // The hash of a file whose objects are not read is nobody's business, and would read them all.
    if (shallow && vexel_yaml::GetFolded(slot.value) != nullptr) {
      SetHash(0);
      return;
    }
    if (!shallow) slot.value->RebuildHash(false);
    hash = Combine(Combine(Combine(hash, slot.key->GetHash()), slot.value->GetHash()), position++);
  }
  SetHash(hash);
}

}  // namespace vexel_yaml
