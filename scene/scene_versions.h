#pragma once

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// Three versions of one scene on their way to the engine.
///
/// The engine merges values, place by place; what belongs together it doesn't know. So whatever must be
/// decided about more than one place, or would be decided there without a word, is settled before: it is made
/// to stand in all three versions alike. The engine then finds no edit there, and takes it as it stands.
struct SceneVersions {
  VexelObjects& base;
  VexelObjects& left;
  VexelObjects& right;

  /// Makes an object the same in all three: a copy of `object`, which may be one of theirs; null for none. A
  /// new object goes to the end of a version.
  void SetObject(const YAMLScalar* file_id, const YAMLNode* object);
};

/// Replaces, adds or removes one entry; `value`, which may be null for none, is then the mapping's.
void SetEntry(YAMLMapping& mapping, const YAMLScalar* key, YAMLNode* value);

}  // namespace vexel_yaml
