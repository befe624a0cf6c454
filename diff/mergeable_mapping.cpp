#include "diff/mergeable_mapping.h"

#include "rules/yaml_sequence_remapper.h"

namespace vexel_yaml {

bool IsMergeableMapping(const FieldPath& path, const YAMLMapping& from, const YAMLMapping& to) {
  bool matched = false;
  const bool by_content = YAMLSequenceRemapper::IsMergeablePath(path, &to, matched);
  if (matched) return by_content;
  if (const ExclusionPathInfo* rule = YAMLSequenceRemapper::FindExclusion(path)) return rule->mergeable;
  if (!from.IsFlow() && !to.IsFlow()) return true;
  return from.HasKey(YAMLScalar::fileID) || to.HasKey(YAMLScalar::fileID);
}

}  // namespace vexel_yaml
