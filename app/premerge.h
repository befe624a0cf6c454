#pragma once

#include <array>
#include <memory>
#include <sstream>
#include <vector>

#include "fixups/three_way_merge.h"
#include "merge/recording_conflict_resolver.h"
#include "platform/timer_stat.h"
#include "scene/scene_documents.h"

namespace vexel_yaml {

/// A version of the asset for a text merge tool: everything that could be merged, and `side`'s values where
/// there were conflicts.
struct PremergeTarget {
  MergeResolve side;
  std::ostringstream text;
  /// For a merge as scenes, which changes it: a copy of its own. Null where values are merged.
  std::unique_ptr<SceneDocuments> versions;
};

/// Makes the texts of both premerged files, each on a thread of its own if `threads`, with the user's
/// resolutions. `documents` and `diffs` are of no use to targets with versions of their own. Throws what
/// merging and post-processing throw, the first target's exception first.
void RunPremerges(std::array<PremergeTarget, 2>& targets, const MergeDocuments& documents,
                  const DiffPair& diffs,
                  const std::vector<RecordingConflictResolver::RecordResolve>& resolutions, bool threads,
                  TimerStat& timer);

}  // namespace vexel_yaml
