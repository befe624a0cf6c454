#pragma once

#include <vector>

#include "scene/derived_lists.h"
#include "scene/scene_plan.h"
#include "scene/scene_versions.h"

namespace vexel_yaml {

/// Makes all three versions what the plan says: the objects that it takes from one of them, the fathers and
/// owners, and the lists that follow. `plan` was made of these versions and is of no use afterwards.
void ExecutePlan(const ScenePlan& plan, const std::vector<DerivedList>& lists, const SceneVersions& versions);

}  // namespace vexel_yaml
