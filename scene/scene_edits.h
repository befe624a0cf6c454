#pragma once

#include <array>

#include "scene/deletions.h"
#include "scene/scene_versions.h"
#include "scene/side_changes.h"

namespace vexel_yaml {

/// Three versions of a scene, and what each side did to it.
struct SceneEdits {
  /// `threads`: looks at both sides at the same time.
  SceneEdits(const SceneVersions& versions, bool threads);

  const VexelObjects& Version(SceneSide side) const {
    return side == SceneSide::kLeft ? versions.left : versions.right;
  }
  const SideChanges& Changes(SceneSide side) const { return changes[static_cast<size_t>(side)]; }
  const Deletions& Deleted(SceneSide side) const { return deletions[static_cast<size_t>(side)]; }

  SceneVersions versions;
  std::array<SideChanges, 2> changes;
  std::array<Deletions, 2> deletions;
};

}  // namespace vexel_yaml
