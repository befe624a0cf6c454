#pragma once

#include <memory>
#include <string>
#include <vector>

#include "merge/recording_conflict_resolver.h"
#include "platform/timer_stat.h"
#include "scene/scene_documents.h"
#include "scene/settle_scene.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

struct SafeMergeOptions {
  bool threads = true;
  /// Whether the result is also compared with the versions.
  bool keep_comparable = false;
};

struct SafeMergeResult {
  /// Ready to be written.
  std::unique_ptr<VexelObjects> merged;
  /// The same in the form of the versions, before and after the repairs; null unless asked for.
  std::unique_ptr<VexelObjects> unrepaired;
  std::unique_ptr<VexelObjects> repaired;
  std::vector<SceneNote> notes;
  /// Whether a broken component dependency is pending.
  bool breaks_dependency = false;
};

/// Merges what ReadScenes has read: the careful form of MergeIntoCopy and PostProcess. Changes `documents`:
/// whoever needs them afterwards merges a copy; records refer to them. Throws what these two throw.
SafeMergeResult SafeMerge(SceneDocuments& documents, RecordingConflictResolver& resolver,
                          const SafeMergeOptions& options, TimerStat& timer);

}  // namespace vexel_yaml
