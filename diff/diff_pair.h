#pragma once

#include "diff/yaml_mapping_diff.h"
#include "platform/timer_stat.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// The diff of one side, and what it is made of.
struct DiffingInfo {
  const VexelObjects& from;
  const VexelObjects& to;
  const YAMLMappingDiff* diff = nullptr;
};

/// The diffs of both sides against base.
struct DiffPair {
  const YAMLMappingDiff* left = nullptr;
  const YAMLMappingDiff* right = nullptr;
};

/// Makes both diffs, the left one on a thread of its own if `threads`. Where both fail, left's exception is
/// thrown.
DiffPair CreateDiffPair(DiffingInfo left, DiffingInfo right, bool threads, TimerStat& timer);

}  // namespace vexel_yaml
