#pragma once

#include <memory>
#include <string>
#include <vector>

#include "fixups/three_way_merge.h"
#include "platform/timer_stat.h"
#include "scene/repeated_keys.h"

namespace vexel_yaml {

/// The three versions of a scene on their way through a safe merge.
struct SceneDocuments : MergeDocuments {
  std::vector<RenumberedObject> renumbered;
  RepeatedKeys repeated_keys;

  std::unique_ptr<SceneDocuments> Copy() const;
  /// The same into documents that are there already, and empty.
  void CopyTo(SceneDocuments& target) const;
};

/// Reads the three files into empty `documents`, on threads of their own if `threads`, and prepares them for
/// a diff, in which repeated keys are unique. What makes a side look
/// damaged is said on standard error. Throws what ReadFiles, RepeatedKeys and PrepareForDiff throw.
void ReadScenes(const std::string& base_path, const std::string& left_path, const std::string& right_path,
                SceneDocuments& documents, bool threads, TimerStat& timer);

}  // namespace vexel_yaml
