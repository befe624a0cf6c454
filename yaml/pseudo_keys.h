#pragma once

#include <cstdint>

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Appends what the header line says to an object that was just read. The pseudo keys count in its hash, so
/// that a change of the class ID or of the stripped mark alone is seen. `position`: how many pairs its text
/// holds.
void AppendPseudoKeys(YAMLMapping& object, const YAMLScalar* file_id, const YAMLScalar* class_id,
                      bool stripped, uint32_t position);

}  // namespace vexel_yaml
