#pragma once

#include <functional>
#include <vector>

#include "scene/list_alignment.h"
#include "scene/object_links.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// A list in base and in the version of a side that deleted something, with the other side's beside it.
struct ListPlace {
  const YAMLSequence& base;
  YAMLSequence& deleter;
  YAMLSequence* other;  ///< Null where the other side has no such list.
  /// The deleter's are left's.
  const std::vector<AlignedElement>& elements;
  /// The same again after each use.
  FieldPath& path;
};

using IsSought = std::function<bool(const YAMLScalar* target)>;

/// Goes through what one object holds in all of them, lists that follow from what objects say themselves and
/// fathers aside. What refers to nothing sought in base or on the other side is passed over, and so are lists
/// whose elements can't be told apart.
class PlaceWalk {
 public:
  /// Gets a reference to another object in base, and what stands there now, null where the other side has
  /// nothing of the kind.
  using OnField =
      std::function<void(const YAMLMapping& reference, YAMLMapping& deleter, const YAMLMapping* other)>;
  /// Comes after the calls for what is in the list's elements, and may change both lists.
  using OnList = std::function<void(const ListPlace& list)>;

  PlaceWalk(IsSought is_sought, OnField on_field, OnList on_list)
      : is_sought_(std::move(is_sought)), on_field_(std::move(on_field)), on_list_(std::move(on_list)) {}

  /// Any of the three may be null.
  void Walk(const YAMLScalar* file_id, const YAMLNode* base, YAMLNode* deleter, YAMLNode* other);

 private:
  void WalkNodes(const YAMLNode* base, YAMLNode* deleter, YAMLNode* other);
  void WalkMappings(const YAMLMapping& base, YAMLMapping& deleter, YAMLMapping* other);
  void WalkLists(const YAMLSequence& base, YAMLSequence& deleter, YAMLSequence* other);

  bool Refers(const YAMLNode* node) const;

  IsSought is_sought_;
  OnField on_field_;
  OnList on_list_;
  FieldPath path_;
  ObjectLinks::Kind kind_ = ObjectLinks::Kind::kOther;
};

/// The sought object that an entry of a list stands for: what it refers to, itself or with one of its fields.
/// An entry that only mentions an object somewhere deeper says something else as well, and so does an
/// override of a prefab instance. Null for none.
const YAMLScalar* TargetOf(const YAMLNode* entry, const IsSought& is_sought);

/// Whether an entry that is nothing but a reference became one to something else: not an edit of what it
/// stood for, but another entry in its place.
bool IsAnotherReference(const YAMLNode* before, const YAMLNode* now);

}  // namespace vexel_yaml
