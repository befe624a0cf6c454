#pragma once

#include <map>
#include <set>
#include <unordered_map>
#include <utility>
#include <vector>

#include "scene/contests.h"

namespace vexel_yaml {

/// Which objects the merged scene is to have, from which version, and where they are to hang: what follows
/// from the choices for all contests together.
class ScenePlan {
 public:
  enum class Source : uint8_t { kNone, kBase, kLeft, kRight };

  /// `edits` must outlive the plan.
  explicit ScenePlan(const SceneEdits& edits);

  /// Starts again from these choices.
  void Follow(const std::vector<Contest>& contests);

  /// Takes a deletion back that nobody contests, because something that stays hangs on it. From now on.
  /// Returns false where that was done before.
  bool Keep(SceneSide deleter, size_t deletion) { return kept_.insert({deleter, deletion}).second; }

  /// Brings the owner of a transform back that both sides deleted, with its components, because something
  /// that stays hangs on it. From now on. Returns false where that was done before.
  bool Restore(const YAMLScalar* transform);

  /// Hangs a transform or prefab instance at the top, where nothing else is left to hang it on. From now on.
  void Uproot(const YAMLScalar* node) { uprooted_.insert(node); }

  /// Whether the merged scene has the object.
  bool Has(const YAMLScalar* file_id) const;

  /// What it hangs on there; null at the top.
  const YAMLScalar* GetFather(const YAMLScalar* node) const;

  /// What an object is a part of there, null for none.
  const YAMLScalar* GetOwner(const YAMLScalar* file_id) const;

  /// The objects that are taken from one version, or dropped, whatever the others say.
  const std::unordered_map<const YAMLScalar*, Source>& GetObjects() const { return objects_; }
  /// The transforms and prefab instances whose father is one version's; kNone hangs them at the top.
  const std::unordered_map<const YAMLScalar*, Source>& GetFathers() const { return fathers_; }

  /// The objects whose owner is one side's.
  const std::unordered_map<const YAMLScalar*, Source>& GetOwners() const { return owners_; }

  const VexelObjects& Version(Source source) const;

 private:
  void FollowDeletion(const Contest& contest);
  void FollowRest(const std::vector<const Contest*>& parts);
  void PutBack(const Contest& contest);
  void FollowUncontested(SceneSide deleter, const std::set<std::pair<SceneSide, size_t>>& contested);

  const SceneEdits& edits_;
  // By deletions, the transforms and prefab instances that a side took out before, and that the other side
  // left where they are.
  std::map<std::pair<SceneSide, size_t>, std::vector<const YAMLScalar*>> taken_out_;
  std::set<std::pair<SceneSide, size_t>> kept_;
  std::set<const YAMLScalar*> restored_;
  std::set<const YAMLScalar*> uprooted_;
  // What somebody decided about as a thing, or a part of one.
  std::set<const YAMLScalar*> chosen_;
  std::unordered_map<const YAMLScalar*, Source> objects_;
  std::unordered_map<const YAMLScalar*, Source> fathers_;
  std::unordered_map<const YAMLScalar*, Source> owners_;
};

/// Settles the contests among themselves: choices that exclude one another are carried out in the order of
/// records, and what can't be carried out any more is open again, with the reason. Adds contests for fathers
/// that would form a circle. Afterwards `plan` follows them, and every object in it hangs on one that it has.
void Reconcile(const SceneEdits& edits, const RecordingConflictResolver& resolver,
               std::vector<Contest>& contests, ScenePlan& plan);

/// The version of a side.
ScenePlan::Source SourceOf(SceneSide side);

/// The version that a choice takes its thing from; kNone where the thing goes.
ScenePlan::Source SourceOf(const Contest& contest);

/// What stands at a contest: what the user chose, else what the default side says.
void Decide(const RecordingConflictResolver& resolver, Contest& contest);

}  // namespace vexel_yaml
