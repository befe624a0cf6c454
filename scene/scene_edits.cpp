#include "scene/scene_edits.h"

namespace vexel_yaml {

SceneEdits::SceneEdits(const SceneVersions& scene)
    : versions(scene),
      changes{FindChanges(scene.base, scene.left), FindChanges(scene.base, scene.right)},
      deletions{Deletions(scene.base, changes[0].removed), Deletions(scene.base, changes[1].removed)} {}

}  // namespace vexel_yaml
