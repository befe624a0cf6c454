#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>

struct yaml_document_s;

namespace vexel_yaml {

class YAMLMapping;
class YAMLScalar;
class YAMLSequence;

/// Double dispatch over the three kinds of node. `YAMLNode::Accept` does not descend: a visitor recurses
/// itself.
class YAMLNodeVisitor {
 public:
  virtual ~YAMLNodeVisitor() = default;
  virtual void Visit(const YAMLScalar& scalar) = 0;
  virtual void Visit(YAMLMapping& mapping) = 0;
  virtual void Visit(YAMLSequence& sequence) = 0;
};

/// A node of a document tree. Parents own their children, except scalars, which are interned and live until
/// the process ends.
class YAMLNode {
 public:
  enum class Kind : uint8_t { kScalar, kMapping, kSequence };

  YAMLNode(const YAMLNode&) = delete;
  YAMLNode& operator=(const YAMLNode&) = delete;
  virtual ~YAMLNode() = default;

  /// Gives the node, with all below it, back to its pool.
  virtual void Free() = 0;

  /// A deep copy, owned by the caller. A scalar is its own copy.
  virtual YAMLNode* Clone() const = 0;

  /// Whether both nodes have the same content, decided by the structural hashes where both are computed
  /// (not 0), else by `EqualsExpensive`.
  virtual bool Equals(const YAMLNode* other) const = 0;

  /// Whether both nodes are equal to the last scalar, whatever their hashes say: of many pairs with equal
  /// hashes some are not equal, and such pairs are easily made on purpose. Keys and elements must be in the
  /// same order; styles don't count.
  bool HasSameContent(const YAMLNode& other) const;

  /// `Equals`, confirmed by the contents. Whoever drops an edit because two nodes are equal asks this.
  bool EqualsByContent(const YAMLNode* other) const {
    return other != nullptr && Equals(other) && HasSameContent(*other);
  }

  /// Equality without hashes. Two mappings count as equal when their ordered key lists are.
  virtual bool EqualsExpensive(const YAMLNode* other) const = 0;

  /// Adds this node and all below it to a libyaml document; returns libyaml's id of it.
  /// Throws YAMLError when libyaml refuses it.
  virtual int PopulateDocument(yaml_document_s* document) const = 0;

  virtual void Accept(YAMLNodeVisitor& visitor) = 0;

  /// Empties the node before it waits in its pool.
  virtual void ResetForAlloc() = 0;

  /// Computes the structural hash again; unless `shallow`, of every node below it first. Editing a tree does
  /// not: whoever edits one and then relies on `Equals` calls this.
  virtual void RebuildHash(bool shallow) = 0;

  /// The node as libyaml writes it, without a final line break. Throws YAMLError.
  std::string GetYAMLString() const;

  Kind GetKind() const { return kind_; }

  /// The node as the kind it is, null where it is another. The non-const forms exist for owners.
  const YAMLScalar* AsScalar() const;
  const YAMLMapping* AsMapping() const;
  YAMLMapping* AsMapping();
  const YAMLSequence* AsSequence() const;
  YAMLSequence* AsSequence();

  /// 32-bit structural hash, 0 while it is not computed (a folded object, say). Empty mappings and sequences
  /// have 0, too.
  uint32_t GetHash() const { return hash_; }
  void SetHash(uint32_t hash) { hash_ = hash; }

  /// 0-based line, within the text of its own document, at which the reader last saw this node start; 0 for
  /// a node built in memory. A scalar, being shared, knows its latest occurrence only.
  uint32_t GetLine() const { return line_.load(std::memory_order_relaxed); }
  void SetLine(uint32_t line) const { line_.store(line, std::memory_order_relaxed); }

  /// One step of the structural hash.
  static uint32_t Combine(uint32_t seed, uint32_t value) {
    return seed ^ (value + 0x9E3779B9U + (seed << 6) + (seed >> 2));
  }

 protected:
  explicit YAMLNode(Kind kind) : kind_(kind) {}

 private:
  uint32_t hash_ = 0;
  // Atomic because reader threads meet at the interned scalars.
  mutable std::atomic<uint32_t> line_ = 0;
  Kind kind_;
};

/// Owns a node outside the trees.
struct FreeNode {
  void operator()(YAMLNode* node) const { node->Free(); }
};
template <typename Node>
using OwnedNodePtr = std::unique_ptr<Node, FreeNode>;

}  // namespace vexel_yaml
