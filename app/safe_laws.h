#pragma once

#include "app/random_scenes.h"

namespace vexel_yaml {

/// Whether a safe merge of base with `side` on both sides gives that side, without a conflict. The order of
/// fields doesn't count.
bool TakesEqualEditsOnce(const VexelObjects& base, const VexelObjects& side);

/// Whether a safe merge either leaves every object whole that is whole in all three versions, or has a
/// pending record at it.
bool KeepsSceneSound(const SceneTriple& triple);

}  // namespace vexel_yaml
