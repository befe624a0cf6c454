#include "scene/settle_scene.h"

#include <iostream>
#include <unordered_map>

#include "platform/thread.h"
#include "scene/derived_lists.h"
#include "scene/object_links.h"
#include "scene/scene_plan.h"
#include "scene/settle_values.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;
using Source = ScenePlan::Source;

// Puts objects that have come back to where base has them, behind those that precede them there.
void RestoreOrder(const VexelObjects& base, const std::unordered_set<const YAMLScalar*>& restored,
                  VexelObjects& version) {
  std::unordered_map<const YAMLScalar*, FileIDs> behind;
  const YAMLScalar* previous = nullptr;
  for (const auto& [file_id, object] : base) {
    if (restored.contains(file_id)) {
      behind[previous].push_back(file_id);
    } else if (version.HasKey(file_id)) {
      previous = file_id;
    }
  }
  FileIDs order = behind[nullptr];
  for (const auto& [file_id, object] : version) {
    if (restored.contains(file_id)) continue;
    order.push_back(file_id);
    const auto followers = behind.find(file_id);
    if (followers != behind.end())
      order.insert(order.end(), followers->second.begin(), followers->second.end());
  }
  version.Reorder(order);
}

class PlanExecution {
 public:
  PlanExecution(const SceneVersions& versions, const ScenePlan& plan) : versions_(versions), plan_(plan) {}

  void Execute(std::vector<DerivedList> lists) {
    // What the plan takes from a version is copied before that version changes.
    CopyFathers();
    TakeObjects();
    SetFathers();
    SetOwners();
    for (const DerivedList& list : lists) Set(list);
  }

 private:
  void CopyFathers() {
    for (const auto& [node, source] : plan_.GetFathers()) {
      YAMLMapping* father =
          source == Source::kNone
              ? nullptr
              : GetFatherReference(const_cast<VexelObjects&>(plan_.Version(source)).Get(node));
      if (father != nullptr) {
        fathers_[node].reset(father->Clone());
      } else {
        fathers_[node].reset(YAMLAlloc<YAMLMapping>::create(true));
        fathers_[node]->Append(YAMLScalar::fileID, YAMLScalar::zero->AsValue());
        fathers_[node]->RebuildHash(true);
      }
    }
  }

  void TakeObjects() {
    std::unordered_set<const YAMLScalar*> restored_left;
    std::unordered_set<const YAMLScalar*> restored_right;
    for (const auto& [file_id, source] : plan_.GetObjects()) {
      const YAMLNode* object = source == Source::kNone ? nullptr : plan_.Version(source).Get(file_id);
      if (object != nullptr && !versions_.left.HasKey(file_id)) restored_left.insert(file_id);
      if (object != nullptr && !versions_.right.HasKey(file_id)) restored_right.insert(file_id);
      versions_.SetObject(file_id, object);
    }
    if (!restored_left.empty()) RestoreOrder(versions_.base, restored_left, versions_.left);
    if (!restored_right.empty()) RestoreOrder(versions_.base, restored_right, versions_.right);
  }

  void SetFathers() {
    for (const auto& [node, father] : fathers_) {
      for (VexelObjects* version : All()) {
        YAMLMapping* reference = GetFatherReference(version->Get(node));
        if (reference == nullptr) continue;
        reference->Clear();
        father->CloneInto(*reference);
        version->Get(node)->RebuildHash(false);
      }
    }
  }

  // Both sides have these objects, and base doesn't.
  void SetOwners() {
    for (const auto& [file_id, source] : plan_.GetOwners()) {
      const YAMLMapping* chosen = GetBody(plan_.Version(source).Get(file_id));
      VexelObjects& other = source == Source::kLeft ? versions_.right : versions_.left;
      YAMLMapping* body = GetBody(other.Get(file_id));
      if (chosen == nullptr || body == nullptr) continue;
      SetEntry(*body, YAMLScalar::mGameObject, chosen->Get(YAMLScalar::mGameObject)->Clone());
      other.Get(file_id)->RebuildHash(false);
    }
  }

  void Set(const DerivedList& list) {
    for (VexelObjects* version : All()) {
      YAMLMapping* body = GetBody(version->Get(list.file_id));
      if (body == nullptr) continue;
      SetEntry(*body, list.key, list.list->Clone());
      version->Get(list.file_id)->RebuildHash(false);
    }
    if (list.key == ChildrenKey()) NumberChildren(*list.list);
  }

  // Files that say the order of children twice say the same again.
  void NumberChildren(const YAMLSequence& children) {
    int index = 0;
    for (const YAMLNode* child : children.GetItems()) {
      YAMLNode* place = YAMLScalar::LookupValue(IntToString(index++));
      for (VexelObjects* version : All()) {
        YAMLNode* object = version->Get(GetLocalTarget(child));
        YAMLMapping* body = GetBody(object);
        if (body == nullptr || !body->HasKey(RootOrderKey())) continue;
        SetEntry(*body, RootOrderKey(), place);
        object->RebuildHash(false);
      }
    }
  }

  std::array<VexelObjects*, 3> All() const { return {&versions_.base, &versions_.left, &versions_.right}; }

  SceneVersions versions_;
  const ScenePlan& plan_;
  std::unordered_map<const YAMLScalar*, OwnedNodePtr<YAMLMapping>> fathers_;
};

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

void Record(std::vector<Contest>& contests, const Records& along, RecordingConflictResolver& resolver) {
  for (Contest& contest : contests) {
    if (!contest.reason.empty()) {
      std::cerr << PathToString(contest.path) << " is pending again: " << contest.reason << '\n';
    }
    resolver.AddRecord(
        {std::move(contest.path), contest.type, contest.resolution, contest.left, contest.right});
  }
  for (const RecordingConflictResolver::Record& record : along) resolver.AddRecord(record);
}

// Each object that is in all three versions, or that both sides added. Where things hang, and the lists that
// follow from that, are settled.
void SettleContents(SceneVersions versions, const FileIDs& touched, RecordingConflictResolver& resolver) {
  const HandsOff is_settled = [](const FieldPath& path) {
    return path.back() == ChildrenKey() || path.back() == YAMLScalar::mComponent ||
           path.back() == YAMLScalar::mFather || path.back() == YAMLScalar::mTransformParent;
  };
  for (const YAMLScalar* file_id : touched) {
    YAMLNode* left = versions.left.Get(file_id);
    YAMLNode* right = versions.right.Get(file_id);
    if (left == nullptr || right == nullptr || left->AsMapping() == nullptr ||
        right->AsMapping() == nullptr) {
      continue;
    }
    const ResolverPathStep step(resolver, file_id);
    YAMLNode* base = versions.base.Get(file_id);
    if (base == nullptr) {
      SettleAddedObject(versions, file_id, is_settled, resolver);
    } else if (base->AsMapping() != nullptr) {
      SettleValues(*base->AsMapping(), *left->AsMapping(), *right->AsMapping(), is_settled, resolver);
    }
  }
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
  const SceneVersions& versions = edits.versions;
  std::vector<SceneFault> in_left;
  const auto check_left = [&] { in_left = CheckScene(versions.left, settled.touched); };
  Thread thread;
  if (threads) {
    thread.Start(check_left);
  } else {
    check_left();
  }
  for (const VexelObjects* version : {&versions.base, &versions.right}) {
    for (SceneFault& fault : CheckScene(*version, settled.touched))
      settled.known_faults.insert(std::move(fault));
  }
  if (threads) thread.Join();
  thread.CheckForExceptions();
  for (SceneFault& fault : in_left) settled.known_faults.insert(std::move(fault));
  return settled;
}

}  // namespace

SettledScene SettleScene(const SceneVersions& versions, RecordingConflictResolver& resolver, bool threads) {
  const SceneEdits edits(versions);
  SettledScene settled = WhatToCheck(edits, threads);
  if (!edits.changes[0].IsEmpty() && !edits.changes[1].IsEmpty()) {
    std::vector<Contest> contests = FindContests(edits);
    ScenePlan plan(edits);
    Reconcile(edits, resolver, contests, plan);
    const Records along = WhatGoesAlong(edits, plan, contests);
    PlanExecution(versions, plan).Execute(MakeDerivedLists(edits, plan, resolver));
    Record(contests, along, resolver);
  }
  SettleContents(versions, settled.touched, resolver);
  return settled;
}

}  // namespace vexel_yaml
