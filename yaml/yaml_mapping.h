#pragma once

#include <atomic>
#include <cstddef>
#include <memory>
#include <utility>
#include <vector>

#include "yaml/position_index.h"
#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

struct FoldedObject;

/// An ordered set of key/value pairs. Owns its values; its keys are interned.
///
/// A key appended again with another value puts the mapping into duplicate-key mode: all pairs are kept, in
/// document order, but every operation marked "keyed" throws the YAMLError
/// "Cannot perform this operation on a YAML file with duplicate keys" and leaves the mapping as it was.
/// Scenes hold such mappings where the engine writes lists as mappings; reading and writing them must work.
///
/// An object's mapping may be folded: its text is known, its content is read when first asked for. Nobody can
/// tell but by the clock, and by asking `GetFolded`. Several threads may ask one mapping at once.
class YAMLMapping : public YAMLNode {
 public:
  /// One pair of a mapping. A slot without a key is a gap that a removed pair has left.
  struct Slot {
    const YAMLScalar* key;
    YAMLNode* value;
  };

  /// Walks the pairs in order, over the gaps.
  class Iterator {
   public:
    Iterator(const Slot* slot, const Slot* end) : slot_(slot), end_(end) { SkipGaps(); }
    const Slot& operator*() const { return *slot_; }
    Iterator& operator++() {
      ++slot_;
      SkipGaps();
      return *this;
    }
    bool operator==(const Iterator& other) const { return slot_ == other.slot_; }

   private:
    void SkipGaps() {
      while (slot_ != end_ && slot_->key == nullptr) ++slot_;
    }
    const Slot* slot_;
    const Slot* end_;
  };

  /// `flow`: written in braces.
  explicit YAMLMapping(bool flow) : YAMLNode(Kind::kMapping), flow_(flow) {}
  ~YAMLMapping() override;

  bool IsFlow() const { return flow_; }
  void SetFlow(bool flow) { flow_ = flow; }
  bool HasDuplicateKeys() const { return duplicates_ != nullptr; }

  /// Makes this empty mapping stand for an object's text, which must outlive it.
  void Fold(const FoldedObject& folded) { folded_.store(&folded, std::memory_order_release); }
  /// What the mapping is folded to, null where its content has been read.
  const FoldedObject* GetFolded() const { return folded_.load(std::memory_order_acquire); }
  /// Reads the content of a folded mapping. Every operation does so where it needs to.
  void Unfold() const {
    if (GetFolded() != nullptr) ReadFolded();
  }

  /// Makes room for this many pairs in all.
  void Reserve(size_t count) { slots_.reserve(count); }

  /// Adds a pair at the end; the mapping then owns `value`. A pair whose key is present with an equal value
  /// is dropped (and not freed); with another value it starts duplicate-key mode. Never throws a YAMLError;
  /// where memory ran out the mapping is as it was.
  void Append(const YAMLScalar* key, YAMLNode* value);

  /// The same, but a pair whose key is present starts duplicate-key mode whatever its value.
  void AppendRepeated(const YAMLScalar* key, YAMLNode* value);

  /// Keyed. Adds a pair at the end. Throws "Cannot add existing key in YAMLMapping".
  void Insert(const YAMLScalar* key, YAMLNode* value);

  /// Keyed. Replaces the value of a key, which keeps its place; returns the old value, now the caller's.
  /// Throws "Cannot change non existing key in YAMLMapping".
  YAMLNode* Change(const YAMLScalar* key, YAMLNode* value);

  /// Keyed. Renames a key in its place. Where the new key exists already, its value stays and the renamed
  /// pair's value is freed. Throws "Cannot change key of non existing key in YAMLMapping".
  void ChangeKey(const YAMLScalar* old_key, const YAMLScalar* new_key);

  /// Keyed. The value, null when absent.
  const YAMLNode* Get(const YAMLScalar* key) const { return Find(key); }
  YAMLNode* Get(const YAMLScalar* key) { return Find(key); }

  /// Keyed. Throws "Cannot get unknown key from yaml mapping".
  YAMLNode& GetRef(const YAMLScalar* key);

  /// Keyed.
  bool HasKey(const YAMLScalar* key) const { return Find(key) != nullptr; }

  /// Keyed. Takes the pair out and returns its value to the caller, null when absent.
  YAMLNode* Steal(const YAMLScalar* key);

  /// Keyed. Takes the pair out and frees its value.
  void Remove(const YAMLScalar* key);

  /// Keyed. The number of keys.
  size_t Size() const;

  /// Keyed. The pairs in order. Adding, removing or reordering ends the validity of iterators.
  Iterator begin() const;
  Iterator end() const;

  /// Keyed. The first key and its value; only on a mapping that is not empty.
  const YAMLScalar* FirstKey() const;
  const YAMLNode* First() const { return (*begin()).value; }
  YAMLNode* First() { return (*begin()).value; }

  /// Puts the keys into the order of `order`, whose unknown and repeated keys are skipped.
  /// Throws "Unmapped key when trying to reorder mapping keys" when `order` lacks one, and changes nothing.
  void Reorder(const std::vector<const YAMLScalar*>& order);

  /// A new sequence, owned by the caller, of one-pair mappings (copies); works in duplicate-key mode.
  YAMLSequence* ToSequence() const;

  /// Frees every value. Duplicate-key mode stays.
  void Clear();

  /// Takes all pairs out, in order, and returns them with their values to the caller; works in duplicate-key
  /// mode and ends it.
  std::vector<Slot> TakePairs();

  /// Empties the mapping without freeing any value: for one that only showed values of others.
  void ForgetPairs();

  /// Makes `target`, which must hold no pair, a deep copy of this mapping's keyed view: a mapping with
  /// duplicate keys copies as an empty one with the same hash.
  void CloneInto(YAMLMapping& target) const;

  /// The pairs of duplicate-key mode, in document order; empty in the normal state.
  const std::vector<Slot>& GetDuplicatePairs() const;

  void Free() override;
  YAMLMapping* Clone() const override;
  bool Equals(const YAMLNode* other) const override;
  bool EqualsExpensive(const YAMLNode* other) const override;
  int PopulateDocument(yaml_document_s* document) const override;
  void Accept(YAMLNodeVisitor& visitor) override { visitor.Visit(*this); }
  void ResetForAlloc() override { Clear(); }
  void RebuildHash(bool shallow) override;

 private:
  void RefuseDuplicates() const;
  void ReadFolded() const;
  YAMLNode* Find(const YAMLScalar* key) const;
  size_t FindSlot(const YAMLScalar* key) const;
  void AddSlot(const YAMLScalar* key, YAMLNode* value);
  void StartDuplicates(const YAMLScalar* key, YAMLNode* value);
  void IndexSlot(size_t slot);
  void CloseGaps();
  void BuildIndex();

  // In an order that leaves no gaps: a scene has some hundred thousand of these.
  bool flow_;
  uint32_t gaps_ = 0;
  std::vector<Slot> slots_;
  // Only for mappings with many keys: the root of a file has one an object, an object only a few.
  std::unique_ptr<PositionIndex> index_;
  std::unique_ptr<std::vector<Slot>> duplicates_;
  mutable std::atomic<const FoldedObject*> folded_ = nullptr;
};

/// The object that `node` is folded to, null where it is no folded mapping.
inline const FoldedObject* GetFolded(const YAMLNode* node) {
  const YAMLMapping* mapping = node == nullptr ? nullptr : node->AsMapping();
  return mapping == nullptr ? nullptr : mapping->GetFolded();
}

inline const YAMLMapping* YAMLNode::AsMapping() const {
  return kind_ == Kind::kMapping ? static_cast<const YAMLMapping*>(this) : nullptr;
}
inline YAMLMapping* YAMLNode::AsMapping() {
  return kind_ == Kind::kMapping ? static_cast<YAMLMapping*>(this) : nullptr;
}

}  // namespace vexel_yaml
