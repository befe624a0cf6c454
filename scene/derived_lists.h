#pragma once

#include "scene/scene_plan.h"

namespace vexel_yaml {

/// A list that follows from what the listed objects say themselves, as the merged scene is to have it.
struct DerivedList {
  const YAMLScalar* file_id;
  const YAMLScalar* body_key;
  const YAMLScalar* key;
  OwnedNodePtr<YAMLSequence> list;
};

/// Makes the lists of children and components that the edits concern: each holds what hangs there in the
/// plan, once, in the order of the side that placed it. Two orders of children that exclude one another are
/// recorded as a conflict.
std::vector<DerivedList> MakeDerivedLists(const SceneEdits& edits, const ScenePlan& plan,
                                          RecordingConflictResolver& resolver);

}  // namespace vexel_yaml
