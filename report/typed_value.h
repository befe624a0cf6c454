#pragma once

#include <array>
#include <string>
#include <vector>

#include "report/object_names.h"
#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

/// What a value is to people, as far as that can be told from itself: a value that only looks a little like a
/// colour must not be shown as one.
struct TypedValue {
  enum class Kind { kNone, kText, kNumber, kVector, kColour, kReference };

  Kind kind = Kind::kNone;
  /// Of a text.
  bool is_empty = false;
  /// Of a number, as it is written.
  std::string number;
  /// Of a vector: the names of its parts, and the numbers as they are written.
  std::vector<std::array<std::string, 2>> parts;
  /// Of a colour: red, green, blue and how opaque it is, 1 being all of it. More than 1 is brighter than
  /// white.
  std::array<double, 4> colour = {};
  /// Of a reference: file ID, the guid of another file, and what people call the object.
  std::string id;
  std::string guid;
  std::string name;
};

/// `node` may be null, which is kNone.
TypedValue TypedValueOf(const YAMLNode* node, ObjectNames& names);

/// Whether the field at `path` is one that is on or off, going by its name. It still may hold a number.
bool IsSwitch(const FieldPath& path);

/// The field's name as people read it, such as "Local Position" for "m_LocalPosition"; without the file ID
/// and the class, which `path` begins with. "Whole object" for a path of nothing else.
std::string FieldLabel(const FieldPath& path);

/// The same for the property that an override is about, such as "Local Position › Y" for "m_LocalPosition.y".
std::string PropertyLabel(std::string_view property);

/// A key as people read it.
std::string Readable(std::string_view key);

}  // namespace vexel_yaml
