#pragma once

#include <optional>

#include <string>

#include "diff/operation.h"
#include "yaml/vexel_objects.h"
#include "yaml/yaml_mapping.h"
#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

/// What the index of an element that base lacks begins with, so that no element of base has the same path.
inline constexpr char kNewElement = '+';

bool IsNewElement(const YAMLScalar* step);

/// What stands at `path` below `node`; the path leads through mappings and lists. Null for a new element.
const YAMLNode* NodeAt(const YAMLNode* node, const FieldPath& path);

/// What an override of a prefab instance is about, empty for another value.
std::string PropertyOf(const YAMLNode* element);

/// Whether a path leads to one of the scalars that make up a reference.
bool IsPartOfReference(const FieldPath& path);

/// What an edit makes of a value; null for nothing. Never given back, like what operations hold.
const YAMLNode* After(const YAMLNode* value, const Operation* edit);

/// The element of a later version's list that stands for base's at `path`, null where it has gone. Nothing
/// where that can't be told.
std::optional<const YAMLNode*> FindElement(const FieldPath& path, const VexelObjects& base,
                                           const VexelObjects& later);

/// What stands in base's place after an edit, for edits of references, lists and whole values; else null.
const YAMLNode* ValueAfter(const YAMLNode* base, const Operation* edit);

/// The path without its last component; it must have one.
FieldPath Above(FieldPath path);

}  // namespace vexel_yaml
