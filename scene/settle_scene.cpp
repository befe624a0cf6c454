#include "scene/settle_scene.h"

#include <algorithm>
#include <iterator>

#include "platform/thread.h"
#include "scene/derived_lists.h"
#include "scene/execute_plan.h"
#include "scene/object_links.h"
#include "scene/outside_places.h"
#include "scene/scene_plan.h"
#include "scene/settle_values.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;
using Source = ScenePlan::Source;
using Records = std::vector<RecordingConflictResolver::Record>;

// What the plan takes or drops together with the things that are contested, so that people can be told. To be
// made before the versions change.
Records WhatGoesAlong(const SceneEdits& edits, const ScenePlan& plan, const std::vector<Contest>& contests) {
  std::unordered_set<const YAMLScalar*> recorded;
  for (const Contest& contest : contests) recorded.insert(contest.path.front());
  Records records;
  const auto look_at = [&](const YAMLScalar* file_id, SceneSide deleter) {
    const auto planned = plan.GetObjects().find(file_id);
    if (planned == plan.GetObjects().end() || !recorded.insert(file_id).second) return;
    const bool is_left = deleter == SceneSide::kLeft;
    if (planned->second == Source::kNone) {
      const ConflictType removal = is_left ? ConflictType::kLeftRemoves : ConflictType::kRightRemoves;
      records.push_back({{file_id}, removal, MergeResolve::kAutomatic, nullptr, nullptr});
    } else if (planned->second == SourceOf(OtherSide(deleter)) &&
               edits.Changes(OtherSide(deleter)).Changed(file_id)) {
      const Operation* edit = EditInShort(edits, OtherSide(deleter), file_id);
      const ConflictType change = is_left ? ConflictType::kRightChanges : ConflictType::kLeftChanges;
      records.push_back(
          {{file_id}, change, MergeResolve::kAutomatic, is_left ? nullptr : edit, is_left ? edit : nullptr});
    }
  };
  for (const SceneSide side : {SceneSide::kLeft, SceneSide::kRight}) {
    for (const YAMLScalar* file_id : edits.Changes(side).removed) look_at(file_id, side);
    for (const YAMLScalar* file_id : edits.Changes(side).added) look_at(file_id, OtherSide(side));
  }
  return records;
}

void Record(std::vector<Contest>& contests, const Records& along, RecordingConflictResolver& resolver,
            std::vector<SceneNote>& notes) {
  for (Contest& contest : contests) {
    if (!contest.reason.empty()) {
      notes.push_back(
          {contest.path.front(), PathToString(contest.path) + " is pending again: " + contest.reason});
    }
    resolver.AddRecord(
        {std::move(contest.path), contest.type, contest.resolution, contest.left, contest.right});
  }
  for (const RecordingConflictResolver::Record& record : along) resolver.AddRecord(record);
}

// Each object that is in all three versions, or that both sides added. Where things hang, and the lists that
// follow from that, are settled.
void SettleContents(SceneVersions versions, const FileIDs& touched, RecordingConflictResolver& resolver) {
  for (const YAMLScalar* file_id : touched) {
    YAMLNode* left = versions.left.Get(file_id);
    YAMLNode* right = versions.right.Get(file_id);
    if (left == nullptr || right == nullptr || left->AsMapping() == nullptr ||
        right->AsMapping() == nullptr) {
      continue;
    }
    const ResolverPathStep step(resolver, file_id);
    YAMLNode* base = versions.base.Get(file_id);
    const ObjectLinks::Kind kind = ReadLinks(left).kind;
    // (The places among siblings follow only where a list of children was made.)
    const HandsOff is_settled = [kind](const FieldPath& path) {
      return IsLink(path, kind) && path.back() != RootOrderKey();
    };
    if (base == nullptr) {
      SettleAddedObject(versions, file_id, is_settled, resolver);
    } else if (base->AsMapping() != nullptr) {
      SettleValues(*base->AsMapping(), *left->AsMapping(), *right->AsMapping(), is_settled, resolver);
    }
  }
}

// What is broken in each version, where an edit may have brought it into the merged scene.
std::set<SceneFault> FindKnownFaults(const SceneEdits& edits, bool threads) {
  const auto check_side = [&](SceneSide side) {
    const SideChanges& changes = edits.Changes(side);
    FileIDs file_ids = changes.changed;
    file_ids.insert(file_ids.end(), changes.added.begin(), changes.added.end());
    const SameAsIn same = {edits.versions.base, [&](const YAMLScalar* id) { return changes.LeftAlone(id); }};
    return CheckScene(edits.Version(side), same, file_ids);
  };
  std::vector<SceneFault> in_left;
  std::vector<SceneFault> in_right;
  RunBoth(
      threads, [&] { in_left = check_side(SceneSide::kLeft); },
      [&] { in_right = check_side(SceneSide::kRight); });
  std::set<SceneFault> faults;
  const auto add = [&](const std::vector<SceneFault>& found) { faults.insert(found.begin(), found.end()); };
  add(in_left);
  add(in_right);
  // What one side removed or both changed may come back as base has it.
  for (const SideChanges& changes : edits.changes) add(CheckScene(edits.versions.base, changes.removed));
  FileIDs changed_by_both;
  std::ranges::copy_if(edits.changes[0].changed, std::back_inserter(changed_by_both),
                       [&](const YAMLScalar* file_id) { return edits.changes[1].Changed(file_id); });
  add(CheckScene(edits.versions.base, changed_by_both));
  return faults;
}

SettledScene WhatToCheck(const SceneEdits& edits, bool threads) {
  SettledScene settled;
  std::unordered_set<const YAMLScalar*> seen;
  const auto add = [&](const FileIDs& file_ids, bool is_vanishing) {
    for (const YAMLScalar* file_id : file_ids) {
      if (seen.insert(file_id).second) settled.touched.push_back(file_id);
      if (is_vanishing) settled.vanishing.insert(file_id);
    }
  };
  for (const SideChanges& changes : edits.changes) {
    add(changes.removed, true);
    add(changes.changed, false);
    add(changes.added, true);
  }
  settled.known_faults = FindKnownFaults(edits, threads);
  return settled;
}

// Objects that nobody edited may get other lists. To be called before the versions change.
void AddHolders(const std::vector<DerivedList>& lists, const VexelObjects& base, SettledScene& settled) {
  std::unordered_set<const YAMLScalar*> seen(settled.touched.begin(), settled.touched.end());
  FileIDs holders;
  for (const DerivedList& list : lists) {
    if (seen.insert(list.file_id).second) holders.push_back(list.file_id);
  }
  // Nobody edited them: they are alike in all versions that have them.
  const std::vector<SceneFault> faults = CheckScene(base, holders);
  settled.known_faults.insert(faults.begin(), faults.end());
  settled.touched.insert(settled.touched.end(), holders.begin(), holders.end());
}

bool HaveBothDoneTheSame(const SceneEdits& edits) {
  const auto& [left, right] = edits.changes;
  if (left.IsEmpty() || left.kinds != right.kinds) return false;
  return std::ranges::all_of(left.kinds, [&](const auto& change) {
    const YAMLNode* object = edits.versions.left.Get(change.first);
    return object == nullptr || object->HasSameContent(*edits.versions.right.Get(change.first));
  });
}

}  // namespace

SettledScene SettleScene(SceneVersions versions, RecordingConflictResolver& resolver, bool threads) {
  const SceneEdits edits(versions, threads);
  SettledScene settled = WhatToCheck(edits, threads);
  if (HaveBothDoneTheSame(edits)) {
    // Whatever it is, also something that is broken.
    for (const YAMLScalar* file_id : settled.touched) versions.SetObject(file_id, versions.left.Get(file_id));
    settled.vanishing.clear();
    return settled;
  }
  if (!edits.changes[0].IsEmpty() && !edits.changes[1].IsEmpty()) {
    std::vector<Contest> contests = FindContests(edits);
    ScenePlan plan(edits);
    Reconcile(edits, resolver, contests, plan);
    const Records along = WhatGoesAlong(edits, plan, contests);
    const OutsidePlaces outside(edits, plan);
    const std::vector<DerivedList> lists = MakeDerivedLists(edits, plan, resolver);
    AddHolders(lists, versions.base, settled);
    ExecutePlan(plan, lists, versions);
    outside.Settle(versions);
    Record(contests, along, resolver, settled.notes);
  }
  SettleContents(versions, settled.touched, resolver);
  return settled;
}

}  // namespace vexel_yaml
