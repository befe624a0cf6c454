#pragma once

#include <cstdint>
#include <string>

#include "scene_plan.h"

/// Writes the documents of a planned scene as an editor would save them, so that a merge result differs
/// from its input only where somebody edited it.
class SceneDocuments {
 public:
  SceneDocuments(uint64_t objects, double edited_share, uint64_t seed) : plan_(objects, edited_share, seed) {}

  uint64_t group_count() const { return plan_.group_count(); }

  /// Appends the documents of one game object, and of the child that this version adds to it.
  void AppendGroup(uint64_t group, Version version, std::string& out) const;

  /// Appends what stands after the last group.
  void AppendTail(Version version, std::string& out) const;

 private:
  ScenePlan plan_;
};
