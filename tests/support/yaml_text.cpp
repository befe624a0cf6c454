#include "tests/support/yaml_text.h"

#include <sstream>
#include <string>

#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

std::unique_ptr<VexelObjects> ObjectsFromText(std::string_view documents) {
  auto objects = std::make_unique<VexelObjects>();
  const std::string header = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n";
  if (!ParseYAMLString(header + std::string(documents), *objects)) throw YAMLError("libyaml can't start");
  return objects;
}

OwnedNode ValueFromText(std::string_view text) {
  const auto objects = ObjectsFromText("--- !v!1 &1\nvalue: " + std::string(text) + "\n");
  return OwnedNode(objects->First()->AsMapping()->Steal(YAMLScalar::Lookup("value")));
}

FieldPath PathFromText(std::string_view text) {
  std::vector<std::string> components;
  YAMLSequenceRemapper::Tokenize(text, '.', components);
  FieldPath path;
  for (const std::string& component : components) path.push_back(YAMLScalar::Lookup(component));
  return path;
}

// Delegates, so that the destructor also runs when a rule is wrong.
ScopedRules::ScopedRules(std::string_view text) : ScopedRules() {
  std::istringstream stream{std::string(text)};
  YAMLSequenceRemapper::LoadSequenceUniqueKeys(stream);
}

ScopedRules::~ScopedRules() {
  YAMLSequenceRemapper::s_ArrayUniqueKeyMap.clear();
  YAMLSequenceRemapper::s_ExclusionFieldPaths.clear();
  YAMLSequenceRemapper::s_DiffExclusionFieldPaths.clear();
  YAMLSequenceRemapper::s_ComparisonFieldPaths.clear();
  YAMLSequenceRemapper::s_PremergeBaseValues = false;
  YAMLSequenceRemapper::defaultPath.clear();
  YAMLSequenceRemapper::defaultDirectPath.clear();
}

}  // namespace vexel_yaml
