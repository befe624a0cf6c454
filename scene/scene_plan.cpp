#include "scene/scene_plan.h"

#include <algorithm>
#include <map>

#include "scene/object_links.h"

namespace vexel_yaml {

using Source = ScenePlan::Source;

Source SourceOf(SceneSide side) { return side == SceneSide::kLeft ? Source::kLeft : Source::kRight; }

Source SourceOf(const Contest& contest) {
  if (contest.side == MergeResolve::kBase) return Source::kBase;
  const SceneSide chosen = contest.side == MergeResolve::kLeft ? SceneSide::kLeft : SceneSide::kRight;
  return contest.deleted && chosen == contest.deleted->by ? Source::kNone : SourceOf(chosen);
}

ScenePlan::ScenePlan(const SceneEdits& edits) : edits_(edits) {
  const VexelObjects& base = edits.versions.base;
  for (const SceneSide side : {SceneSide::kLeft, SceneSide::kRight}) {
    for (const YAMLScalar* node : edits.Changes(side).changed) {
      const YAMLScalar* father = FatherIn(base, node);
      const size_t deletion = father == nullptr ? Deletions::kNone : edits.Deleted(side).Find(father);
      if (deletion == Deletions::kNone || FatherIn(edits.Version(OtherSide(side)), node) != father) continue;
      taken_out_[{side, deletion}].push_back(node);
    }
  }
}

bool ScenePlan::Restore(const YAMLScalar* transform) {
  const VexelObjects& base = edits_.versions.base;
  const Deletions& deleted = edits_.Deleted(SceneSide::kLeft);
  const YAMLScalar* owner = ReadLinks(base.Get(transform)).owner;
  if (!restored_.insert(transform).second) return false;
  for (const YAMLScalar* file_id : deleted.Get()[deleted.Find(transform)].objects) {
    const bool belongs = file_id == owner || ReadLinks(base.Get(file_id)).owner == owner;
    if (owner != nullptr && belongs) restored_.insert(file_id);
  }
  return true;
}

const VexelObjects& ScenePlan::Version(Source source) const {
  switch (source) {
    case Source::kLeft:
      return edits_.versions.left;
    case Source::kRight:
      return edits_.versions.right;
    case Source::kNone:
    case Source::kBase:
      break;
  }
  return edits_.versions.base;
}

bool ScenePlan::Has(const YAMLScalar* file_id) const {
  const auto planned = objects_.find(file_id);
  if (planned != objects_.end()) {
    return planned->second != Source::kNone && Version(planned->second).HasKey(file_id);
  }
  const SceneVersions& versions = edits_.versions;
  const bool in_left = versions.left.HasKey(file_id);
  const bool in_right = versions.right.HasKey(file_id);
  return versions.base.HasKey(file_id) ? in_left && in_right : in_left || in_right;
}

const YAMLScalar* ScenePlan::GetFather(const YAMLScalar* node) const {
  if (uprooted_.contains(node)) return nullptr;
  const auto father = fathers_.find(node);
  if (father != fathers_.end()) return FatherIn(Version(father->second), node);
  const auto object = objects_.find(node);
  if (object != objects_.end()) return FatherIn(Version(object->second), node);
  const SceneVersions& versions = edits_.versions;
  if (!versions.left.HasKey(node)) return FatherIn(versions.right, node);
  const YAMLScalar* left = FatherIn(versions.left, node);
  if (!versions.right.HasKey(node) || !versions.base.HasKey(node)) return left;
  return left != FatherIn(versions.base, node) ? left : FatherIn(versions.right, node);
}

const YAMLScalar* ScenePlan::GetOwner(const YAMLScalar* file_id) const {
  const auto owner_in = [&](const VexelObjects& version) { return ReadLinks(version.Get(file_id)).owner; };
  const auto owner = owners_.find(file_id);
  if (owner != owners_.end()) return owner_in(Version(owner->second));
  const auto object = objects_.find(file_id);
  if (object != objects_.end()) return owner_in(Version(object->second));
  const auto& [base, left, right] = edits_.versions;
  const auto has_changed = [&](const SideChanges& changes) { return changes.Changed(file_id); };
  if (base.HasKey(file_id) && std::ranges::none_of(edits_.changes, has_changed)) return owner_in(base);
  if (!left.HasKey(file_id)) return owner_in(right.HasKey(file_id) ? right : base);
  const YAMLScalar* of_left = owner_in(left);
  if (!right.HasKey(file_id) || !base.HasKey(file_id)) return of_left;
  const YAMLScalar* of_base = owner_in(base);
  const YAMLScalar* of_right = owner_in(right);
  if (of_left == of_base) return of_right;
  return of_right == of_base || of_right == of_left ? of_left : of_base;
}

void ScenePlan::Follow(const std::vector<Contest>& contests) {
  objects_.clear();
  fathers_.clear();
  owners_.clear();
  std::set<std::pair<SceneSide, size_t>> contested;
  std::map<std::pair<SceneSide, size_t>, std::vector<const Contest*>> deletions;
  for (const Contest& contest : contests) {
    if (!contest.deleted || contest.deleted->deletion == Deletions::kNone) continue;
    deletions[{contest.deleted->by, contest.deleted->deletion}].push_back(&contest);
    contested.insert({contest.deleted->by, contest.deleted->deletion});
  }
  FollowUncontested(SceneSide::kLeft, contested);
  FollowUncontested(SceneSide::kRight, contested);
  for (const auto& [deletion, parts] : deletions) FollowRest(parts);
  chosen_.clear();
  for (const Contest& contest : contests) {
    if (contest.deleted && contest.IsSettled())
      chosen_.insert(contest.deleted->objects.begin(), contest.deleted->objects.end());
  }
  for (const Contest& contest : contests) {
    if (contest.deleted) FollowDeletion(contest);
  }
  for (const Contest& contest : contests) {
    if (!contest.deleted) (contest.is_about_owner ? owners_ : fathers_)[contest.node] = SourceOf(contest);
  }
  for (const YAMLScalar* file_id : restored_) objects_[file_id] = Source::kBase;
  for (const YAMLScalar* node : uprooted_) fathers_[node] = Source::kNone;
}

// Also where the other side touched what follows from others only, or fields that stand in another order now:
// the engine would take that for an edit.
void ScenePlan::FollowUncontested(SceneSide deleter,
                                  const std::set<std::pair<SceneSide, size_t>>& contested) {
  const std::vector<Deletion>& deletions = edits_.Deleted(deleter).Get();
  for (size_t i = 0; i < deletions.size(); ++i) {
    const bool is_kept = kept_.contains({deleter, i});
    if (contested.contains({deleter, i})) continue;
    for (const YAMLScalar* file_id : deletions[i].objects) {
      const bool touched = edits_.Changes(OtherSide(deleter)).Changed(file_id);
      if (is_kept || touched) objects_[file_id] = is_kept ? SourceOf(OtherSide(deleter)) : Source::kNone;
    }
  }
}

// Where parts of a deleted thing were moved out, and at least one of them is to stand where base has it, the
// rest stays, too; else it goes.
void ScenePlan::FollowRest(const std::vector<const Contest*>& parts) {
  const Contest::Deleted& deleted = *parts.front()->deleted;
  const bool stays =
      kept_.contains({deleted.by, deleted.deletion}) ||
      std::ranges::any_of(parts, [](const Contest* part) { return SourceOf(*part) == Source::kBase; });
  for (const YAMLScalar* file_id : edits_.Deleted(deleted.by).Get()[deleted.deletion].objects) {
    objects_[file_id] = stays ? SourceOf(OtherSide(deleted.by)) : Source::kNone;
  }
}

void ScenePlan::FollowDeletion(const Contest& contest) {
  const Contest::Deleted& deleted = *contest.deleted;
  const Source source = SourceOf(contest);
  for (const YAMLScalar* file_id : deleted.objects) objects_[file_id] = source;
  PutBack(contest);
  if (source == SourceOf(OtherSide(deleted.by))) return;
  // Without what the other side made of it.
  for (const YAMLScalar* file_id : deleted.additions) objects_[file_id] = Source::kNone;
  for (const YAMLScalar* node : deleted.moved_in) {
    if (source != Source::kBase || !contest.IsSettled() || !chosen_.contains(node))
      fathers_[node] = Source::kBase;
  }
}

// What a side took out of a thing before it deleted that belongs to it as long as the thing is there.
void ScenePlan::PutBack(const Contest& contest) {
  const auto taken_out = taken_out_.find({contest.deleted->by, contest.deleted->deletion});
  if (taken_out == taken_out_.end()) return;
  const Deletion& deletion = edits_.Deleted(taken_out->first.first).Get()[taken_out->first.second];
  if (contest.path.front() != deletion.thing) return;
  for (const YAMLScalar* node : taken_out->second) {
    if (Has(FatherIn(edits_.versions.base, node))) fathers_[node] = Source::kBase;
  }
}

}  // namespace vexel_yaml
