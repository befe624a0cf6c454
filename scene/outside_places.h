#pragma once

#include <array>
#include <unordered_set>
#include <vector>

#include "scene/scene_plan.h"

namespace vexel_yaml {

/// Where a deleted thing stands in other objects: entries of their lists and fields that refer to it. Lists
/// that follow from what objects say themselves don't count.
class OutsidePlaces {
 public:
  /// `plan` says what becomes of each deleted thing. To be made before the plan is carried out.
  OutsidePlaces(const SceneEdits& edits, const ScenePlan& plan);

  /// Brings the places of what stays after all back into the version of the side that deleted it, and takes
  /// those of what goes out of the other side's. Both are then no edits of these sides any more. What the
  /// other side put in the place of an entry that only went with its thing stands against no edit, either. To
  /// be called when the plan has been carried out.
  void Settle(const SceneVersions& versions) const;

 private:
  using FileIDSet = std::unordered_set<const YAMLScalar*>;

  // What one side deleted, and what else there was below it.
  struct Fate {
    std::vector<const YAMLScalar*> removed;
    std::vector<const YAMLScalar*> added_by_other;  // That stays.
    std::vector<const YAMLScalar*> changed_by_deleter;
    std::vector<const YAMLScalar*> changed_by_other;
    std::vector<const YAMLScalar*> changed_by_both;
    FileIDSet staying;
    FileIDSet as_in_base;  // Of these.
    FileIDSet going;
  };

  static void SettleFate(const Fate& fate, const VexelObjects& base, VexelObjects& deleter,
                         VexelObjects& other);

  std::array<Fate, 2> fates_;
};

}  // namespace vexel_yaml
