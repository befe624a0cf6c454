#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// Three versions of one scene, as a merge meets them: file IDs that collide are renumbered already.
struct SceneTriple {
  std::unique_ptr<VexelObjects> base;
  std::unique_ptr<VexelObjects> left;
  std::unique_ptr<VexelObjects> right;
  /// Whether a key, a list element or an object may have been put elsewhere.
  bool moved = false;
};

/// The scene that the text of some documents holds, without the directives. Throws YAMLError.
std::unique_ptr<VexelObjects> ReadScene(const std::string& documents);

/// A small scene and two edited copies, always the same for one seed. Values, keys and file IDs come from
/// small pools, so that both sides often meet; no edited value is ever that of base again.
SceneTriple RandomTriple(uint32_t seed);

}  // namespace vexel_yaml
