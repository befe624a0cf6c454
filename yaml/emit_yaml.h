#pragma once

#include <string>

#include "yaml/yaml_node.h"

namespace vexel_yaml {

/// `node` as libyaml writes it, without a final line break. Throws what `YAMLNode::GetYAMLString` throws,
/// which most nodes reach by a shorter way.
std::string EmitWithLibyaml(const YAMLNode& node);

}  // namespace vexel_yaml
