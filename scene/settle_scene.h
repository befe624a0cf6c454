#pragma once

#include <set>
#include <string>
#include <unordered_set>
#include <vector>

#include "merge/recording_conflict_resolver.h"
#include "scene/scene_check.h"
#include "scene/scene_versions.h"

namespace vexel_yaml {

/// A line for people: a choice of theirs that is pending again, or what is broken.
struct SceneNote {
  const YAMLScalar* file_id;  ///< The object that it is about; null for one about several.
  std::string text;
};

/// What has to be looked at once the engine has merged a settled scene.
struct SettledScene {
  /// The objects that somebody edited, each once.
  std::vector<const YAMLScalar*> touched;
  /// The objects that some version had, and not all of them: references to them may lead nowhere now.
  std::unordered_set<const YAMLScalar*> vanishing;
  /// What was broken in some version already.
  std::set<SceneFault> known_faults;
  std::vector<SceneNote> notes;
};

/// Settles whatever the engine can't decide place by place: what happens to things that one side deleted and
/// the other edited, where objects hang, the lists that follow from that, and values that both sides edited.
/// Conflicts are recorded; what is decided stands in all three versions alike afterwards. A choice that can't
/// be carried out is pending again, and noted. `threads`: looks at the versions side by side.
SettledScene SettleScene(SceneVersions versions, RecordingConflictResolver& resolver, bool threads);

/// Repairs what the merge broke in a merged scene and has one repair; records and notes everything else as
/// pending. `base`: as it was settled; the merged scene differs from it only in what was touched.
void CheckMergedScene(SettledScene& settled, const VexelObjects& base, VexelObjects& merged,
                      RecordingConflictResolver& resolver, bool threads);

}  // namespace vexel_yaml
