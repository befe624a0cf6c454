#pragma once

#include <vector>

#include "scene/scene_documents.h"

namespace vexel_yaml {

/// The objects that somebody edited, and those that refer to what came or went. Reads objects of `scene`:
/// what is merged afterwards must be another copy, since what was read in one version alone counts as edited.
std::vector<const YAMLScalar*> FindEdited(const SceneDocuments& scene);

/// Copies into empty documents what a safe merge looks at to merge some edited objects of `whole`: these,
/// what they refer to and hang on. Others that were edited, too, are copied as base has them.
///
/// A scene of 30,000 objects, of which 1 % are edited a side, took 0.2 s to merge, most of it for walks over
/// objects that are the same in all versions. Whoever settles a conflict waits for that with every click, so
/// only excerpts are merged then, and the whole scene once, when the result is kept.
void MakeExcerpt(const SceneDocuments& whole, const std::vector<const YAMLScalar*>& edited,
                 SceneDocuments& excerpt);

}  // namespace vexel_yaml
