#pragma once

#include <memory>
#include <string_view>

#include "rules/yaml_sequence_remapper.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

using OwnedNode = OwnedNodePtr<YAMLNode>;

/// The objects of an asset file, given without its two directives. Throws YAMLError.
std::unique_ptr<VexelObjects> ObjectsFromText(std::string_view documents);

/// A single value in flow style, such as "[1, {a: 2}]". Throws YAMLError.
OwnedNode ValueFromText(std::string_view text);

/// The field path of "12.GameObject.m_Tags".
FieldPath PathFromText(std::string_view text);

/// Puts the rules of a rules file in force while it lives.
class ScopedRules {
 public:
  explicit ScopedRules(std::string_view text);
  ~ScopedRules();

 private:
  ScopedRules() = default;
};

}  // namespace vexel_yaml
