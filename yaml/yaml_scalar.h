#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "yaml/yaml_node.h"

namespace vexel_yaml {

/// A text value or key. Interned: one text has one object for the whole run, so equality is pointer
/// identity. Immutable but for its line.
class YAMLScalar final : public YAMLNode {
 public:
  /// The one scalar of that text, made on first use; never null. May be called from any thread.
  static const YAMLScalar* Lookup(std::string_view text);

  /// `Lookup` for use as a value in a tree, whose slots hold non-const nodes.
  static YAMLNode* LookupValue(std::string_view text) { return Lookup(text)->AsValue(); }

  /// Interns the scalars below. `initialize` calls it once, before anything else.
  static void initializeConstants();

  /// UTF-8.
  const std::string& GetText() const { return text_; }

  /// The number that the text starts with, after white space; 0 where it starts with none. Never depends on
  /// the user's locale and never fails.
  int32_t GetIntValue() const;
  float GetFloatValue() const;

  /// Throws YAMLError "Cannot write a value that is not UTF-8" or "Cannot write a value of 2 GiB or more": a
  /// file that holds this text could not be read again, or libyaml can't count its bytes.
  void CheckWritable() const {
    if (!is_writable_) RefuseToWrite();
  }

  /// Whether this is a key that stands for a part of an object's header line.
  bool IsPseudoKey() const {
    return this == fileIDPlaceHolderName || this == classIDPlaceHolderName ||
           this == strippedPrefabPlaceHolderName;
  }

  /// This scalar as a value in a tree. Dropping the const is safe: no operation of a node changes a scalar.
  YAMLNode* AsValue() const { return const_cast<YAMLScalar*>(this); }

  void Free() override {}
  YAMLNode* Clone() const override { return AsValue(); }
  bool Equals(const YAMLNode* other) const override { return other == this; }
  bool EqualsExpensive(const YAMLNode* other) const override;
  int PopulateDocument(yaml_document_s* document) const override;
  void Accept(YAMLNodeVisitor& visitor) override { visitor.Visit(*this); }
  void ResetForAlloc() override {}
  void RebuildHash(bool /*shallow*/) override {}

  static constexpr const YAMLScalar* null = nullptr;
  static const YAMLScalar* underscore;
  static const YAMLScalar* empty;
  static const YAMLScalar* zero;
  static const YAMLScalar* one;
  static const YAMLScalar* monoBehaviour;
  static const YAMLScalar* mScript;
  static const YAMLScalar* mFather;
  static const YAMLScalar* transform;
  static const YAMLScalar* rectTransform;
  static const YAMLScalar* fileID;
  static const YAMLScalar* star;
  static const YAMLScalar* prefab;
  static const YAMLScalar* prefabInstance;
  static const YAMLScalar* mModification;
  static const YAMLScalar* mTransformParent;
  static const YAMLScalar* mPrefabInstance;
  static const YAMLScalar* mPrefabInternal;
  static const YAMLScalar* mPrefab;
  static const YAMLScalar* guid;
  static const YAMLScalar* fileIDPlaceHolderName;
  static const YAMLScalar* classIDPlaceHolderName;
  static const YAMLScalar* strippedPrefabPlaceHolderName;
  static const YAMLScalar* mergeTypeInfo;
  static const YAMLScalar* mergeTypeInfoPersistentTypeID;
  static const YAMLScalar* mergeTypeInfoTypeName;
  static const YAMLScalar* mergeTypeInfoIsMultiInstance;
  static const YAMLScalar* mergeTypeInfoBasePersistentTypeID;
  static const YAMLScalar* mergeTypeInfoRequires;
  static const YAMLScalar* mergeTypeInfoConflicts;
  static const YAMLScalar* gameObject;
  static const YAMLScalar* mComponent;
  static const YAMLScalar* mGameObject;

 private:
  template <typename T>
  friend class YAMLAlloc;

  explicit YAMLScalar(std::string_view text);

  [[noreturn]] void RefuseToWrite() const;

  std::string text_;
  // Found out once: what is written is asked for it at every occurrence.
  bool is_writable_;
};

inline const YAMLScalar* YAMLNode::AsScalar() const {
  return kind_ == Kind::kScalar ? static_cast<const YAMLScalar*>(this) : nullptr;
}

/// Orders scalars by their texts, byte by byte, where an order becomes visible.
struct ScalarTextLess {
  bool operator()(const YAMLScalar* a, const YAMLScalar* b) const { return a->GetText() < b->GetText(); }
};

/// Names a place below the root of a document: mapping keys, and decimal indices for sequence elements.
using FieldPath = std::vector<const YAMLScalar*>;

/// Readies the document model; must run before any other use of it.
void initialize();

/// Decimal text of a number that is not negative.
std::string IntToString(int value);

}  // namespace vexel_yaml
