#pragma once

#include <cstdint>
#include <map>
#include <vector>

#include "scene/scene_edits.h"

namespace vexel_yaml {

/// One thing that one side did to something that the other side deleted.
struct Deed {
  enum class Kind : uint8_t { kEdited, kMovedOut, kAdded, kMovedIn, kRefers, kRequires };
  Kind kind;
  /// The object in which it did it.
  const YAMLScalar* file_id;
  /// The deleted object that this concerns.
  const YAMLScalar* object;
};

/// Finds what the side that deleted nothing of it did to each thing that `deleter` deleted, by the places of
/// the deletions; nothing for those that it left alone.
std::map<size_t, std::vector<Deed>> FindDeeds(const SceneEdits& edits, SceneSide deleter);

}  // namespace vexel_yaml
