#pragma once

#include <compare>
#include <functional>
#include <string>
#include <vector>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// Something that an engine can't load as it stands, or would drop.
struct SceneFault {
  const YAMLScalar* file_id;  ///< The object where it shows.
  std::string text;           ///< Such as "hangs below 400, which isn't there".

  auto operator<=>(const SceneFault&) const = default;
};

/// Checks that some objects of a scene are sound: a game object has one transform and lists its components
/// and nothing else, a father lists its children and nothing else, each once, no fathers form a circle, what
/// is stripped has its prefab instance, and references within the file lead to objects. In the order of
/// `file_ids`; those that the scene lacks are passed over.
std::vector<SceneFault> CheckScene(const VexelObjects& objects,
                                   const std::vector<const YAMLScalar*>& file_ids);

/// Where other objects may be looked at instead, for whoever checks several versions of a scene: to read an
/// object takes long, and most are the same in all.
struct SameAsIn {
  const VexelObjects& objects;
  std::function<bool(const YAMLScalar* file_id)> is_same;
};

/// The same, with what is the same elsewhere looked at there.
std::vector<SceneFault> CheckScene(const VexelObjects& objects, const SameAsIn& same,
                                   const std::vector<const YAMLScalar*>& file_ids);

/// The same for all objects.
std::vector<SceneFault> CheckScene(const VexelObjects& objects);

}  // namespace vexel_yaml
