#pragma once

#include "scene/scene_documents.h"

namespace vexel_yaml {

/// Copies into empty documents what a safe merge of `whole` looks at: the objects that somebody edited, what
/// these refer to and hang on, and what refers to those that came or went.
///
/// A scene of 30,000 objects, of which 1 % are edited a side, took 0.2 s to merge, most of it for walks over
/// objects that are the same in all versions. Whoever settles a conflict waits for that with every click, so
/// only the excerpt is merged then, and the whole scene once, when the result is kept.
void MakeExcerpt(const SceneDocuments& whole, SceneDocuments& excerpt);

}  // namespace vexel_yaml
