#pragma once

#include "diff/yaml_mapping_diff.h"

namespace vexel_yaml {

/// The diff of two versions of a file for people. A list whose elements can't be told apart is changed as a
/// whole there, where YAMLMappingDiff::Diff throws.
const YAMLMappingDiff* DiffToShow(const YAMLMapping& from, const YAMLMapping& to);

}  // namespace vexel_yaml
