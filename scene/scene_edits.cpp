#include "scene/scene_edits.h"

#include "platform/thread.h"

namespace vexel_yaml {

namespace {

std::array<SideChanges, 2> FindBothChanges(const SceneVersions& scene, bool threads) {
  std::array<SideChanges, 2> changes;
  RunBoth(
      threads, [&] { changes[0] = FindChanges(scene.base, scene.left); },
      [&] { changes[1] = FindChanges(scene.base, scene.right); });
  return changes;
}

}  // namespace

SceneEdits::SceneEdits(const SceneVersions& scene, bool threads)
    : versions(scene),
      changes(FindBothChanges(scene, threads)),
      deletions{Deletions(scene.base, changes[0].removed), Deletions(scene.base, changes[1].removed)} {}

}  // namespace vexel_yaml
