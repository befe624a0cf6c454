#include "diff/operation.h"

#include <utility>

#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

void ChangeMappingOperation::ResetForAlloc() {
  YAMLAlloc<YAMLMappingDiff>::free(std::exchange(diff_, nullptr));
}

void ChangeSequenceOperation::ResetForAlloc() {
  YAMLAlloc<YAMLSequenceRemapper>::free(std::exchange(remapper_, nullptr));
  YAMLAlloc<YAMLSequenceDiff>::free(std::exchange(diff_, nullptr));
}

}  // namespace vexel_yaml
