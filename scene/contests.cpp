#include "scene/contests.h"

#include <algorithm>
#include <stdexcept>
#include <unordered_map>
#include <unordered_set>

#include "diff/merge_tree_visitor.h"
#include "scene/deeds.h"
#include "scene/holders.h"
#include "scene/object_links.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;
using Deeds = std::vector<Deed>;

FileIDs ObjectsOf(const Deeds& deeds, Deed::Kind kind) {
  FileIDs file_ids;
  for (const Deed& deed : deeds) {
    if (deed.kind == kind) file_ids.push_back(deed.file_id);
  }
  return file_ids;
}

Contest MakeDeletionContest(const SceneEdits& edits, SceneSide deleter, size_t deletion,
                            const YAMLScalar* thing, FileIDs objects, const Deeds& deeds) {
  FileIDs shown;
  for (const Deed& deed : deeds) shown.push_back(deed.file_id);
  const Operation* removal = YAMLAlloc<RemoveOperation>::create(true);
  const Operation* edit = EditsInShort(edits, OtherSide(deleter), shown);
  Contest contest;
  contest.path = {thing};
  contest.left = deleter == SceneSide::kLeft ? removal : edit;
  contest.right = deleter == SceneSide::kLeft ? edit : removal;
  contest.deleted = {deleter,
                     deletion,
                     std::move(objects),
                     ObjectsOf(deeds, Deed::Kind::kAdded),
                     ObjectsOf(deeds, Deed::Kind::kMovedIn),
                     ObjectsOf(deeds, Deed::Kind::kRequires)};
  return contest;
}

// A part that was moved out is contested by itself, unless it is in another one, and the rest where something
// was done to it.
void AddDeletionContests(const SceneEdits& edits, SceneSide deleter, size_t deletion, const Deeds& deeds,
                         std::vector<Contest>& contests) {
  const VexelObjects& base = edits.versions.base;
  const Deletion& deleted = edits.Deleted(deleter).Get()[deletion];
  std::unordered_set<const YAMLScalar*> moved_out;
  for (const YAMLScalar* node : ObjectsOf(deeds, Deed::Kind::kMovedOut)) {
    const YAMLScalar* owner = ReadLinks(base.Get(node)).owner;
    moved_out.insert(owner == nullptr ? node : owner);
  }
  const auto part_of = FindTops(Holders(base, deleted.objects), deleted.objects, moved_out);
  struct Part {
    FileIDs objects;
    Deeds deeds;
  };
  // Null for the rest. In the order of base.
  std::vector<const YAMLScalar*> things;
  std::unordered_map<const YAMLScalar*, Part> parts;
  for (const YAMLScalar* file_id : deleted.objects) {
    const auto [part, is_new] = parts.try_emplace(part_of.at(file_id));
    if (is_new) things.push_back(part->first);
    part->second.objects.push_back(file_id);
  }
  for (const Deed& deed : deeds) parts[part_of.at(deed.object)].deeds.push_back(deed);
  for (const YAMLScalar* thing : things) {
    Part& part = parts[thing];
    if (part.deeds.empty()) continue;
    contests.push_back(MakeDeletionContest(edits, deleter, deletion, thing == nullptr ? deleted.thing : thing,
                                           std::move(part.objects), part.deeds));
  }
}

bool IsFatherContested(const SceneEdits& edits, const YAMLScalar* node) {
  const SceneVersions& versions = edits.versions;
  if (GetFatherReference(versions.left.Get(node)) == nullptr ||
      GetFatherReference(versions.right.Get(node)) == nullptr) {
    return false;
  }
  const YAMLScalar* left = FatherIn(versions.left, node);
  const YAMLScalar* right = FatherIn(versions.right, node);
  if (left == right) return false;
  if (!versions.base.HasKey(node)) return true;
  const YAMLScalar* base = FatherIn(versions.base, node);
  return left != base && right != base;
}

bool IsOwnerContested(const SceneEdits& edits, const YAMLScalar* component) {
  const ObjectLinks left = ReadLinks(edits.versions.left.Get(component));
  const ObjectLinks right = ReadLinks(edits.versions.right.Get(component));
  return !left.is_stripped && !right.is_stripped && left.body_key == right.body_key &&
         left.owner != right.owner && left.owner != nullptr && right.owner != nullptr;
}

const Operation* Edit(FieldPath path, const YAMLNode* base, const YAMLNode* side) {
  try {
    return CreateDiffOperation(path, base, side);
  } catch (const std::length_error&) {
    // A list whose elements can't be told apart is shown as a whole, with what it is a part of.
    return YAMLAlloc<ChangeOperation>::create(side);
  }
}

// What a side did at one place, null for nothing. A copy, since what stands there may change.
const Operation* CopyOfEdit(const FieldPath& path, const YAMLNode* base, const YAMLNode* side) {
  const Operation* edit = Edit(path, base, side);
  return edit == nullptr ? nullptr : MergeTreeCloneVisitor::Clone(edit);
}

}  // namespace

FieldPath FatherPath(const YAMLScalar* node, const YAMLNode* object) {
  const ObjectLinks links = ReadLinks(object);
  FieldPath path = {node, links.body_key};
  if (links.kind == ObjectLinks::Kind::kPrefabInstance) {
    path.push_back(YAMLScalar::mModification);
    path.push_back(YAMLScalar::mTransformParent);
  } else {
    path.push_back(YAMLScalar::mFather);
  }
  return path;
}

const Operation* EditInShort(const SceneEdits& edits, SceneSide side, const YAMLScalar* file_id) {
  return CopyOfEdit({file_id}, edits.versions.base.Get(file_id), edits.Version(side).Get(file_id));
}

const Operation* EditsInShort(const SceneEdits& edits, SceneSide side, const FileIDs& objects) {
  auto* diff = YAMLAlloc<YAMLMappingDiff>::create();
  for (const YAMLScalar* file_id : objects) {
    if (diff->HasKey(file_id)) continue;
    if (const Operation* edit = EditInShort(edits, side, file_id)) diff->Add(file_id, edit);
  }
  return YAMLAlloc<ChangeMappingOperation>::create(diff, true);
}

namespace {

const YAMLNode* OwnerReference(const YAMLNode* object) {
  const YAMLMapping* body = GetBody(object);
  return body == nullptr ? nullptr : body->Get(YAMLScalar::mGameObject);
}

}  // namespace

Contest MakeFatherContest(const SceneEdits& edits, const YAMLScalar* node) {
  const SceneVersions& versions = edits.versions;
  const YAMLNode* base = GetFatherReference(versions.base.Get(node));
  Contest contest;
  contest.path = FatherPath(node, versions.left.Get(node));
  contest.node = node;
  if (!versions.base.HasKey(node)) contest.type = ConflictType::kBothAdd;
  contest.left = CopyOfEdit(contest.path, base, GetFatherReference(versions.left.Get(node)));
  contest.right = CopyOfEdit(contest.path, base, GetFatherReference(versions.right.Get(node)));
  return contest;
}

Contest MakeOwnerContest(const SceneEdits& edits, const YAMLScalar* component) {
  const YAMLNode* left = edits.versions.left.Get(component);
  const YAMLNode* right = edits.versions.right.Get(component);
  Contest contest;
  contest.path = {component, ReadLinks(left).body_key, YAMLScalar::mGameObject};
  contest.type = ConflictType::kBothAdd;
  contest.node = component;
  contest.is_about_owner = true;
  contest.left = CopyOfEdit(contest.path, nullptr, OwnerReference(left));
  contest.right = CopyOfEdit(contest.path, nullptr, OwnerReference(right));
  return contest;
}

Contest MakeRequirementContest(const SceneEdits& edits, SceneSide deleter, const YAMLScalar* component) {
  const Operation* addition = EditsInShort(edits, OtherSide(deleter), {component});
  Contest contest;
  contest.path = {component};
  contest.left = deleter == SceneSide::kLeft ? nullptr : addition;
  contest.right = deleter == SceneSide::kLeft ? addition : nullptr;
  contest.deleted = {deleter, Deletions::kNone, {}, {component}, {}, {}};
  return contest;
}

std::vector<Contest> FindContests(const SceneEdits& edits) {
  std::vector<Contest> contests;
  for (const SceneSide deleter : {SceneSide::kLeft, SceneSide::kRight}) {
    for (const auto& [deletion, deeds] : FindDeeds(edits, deleter)) {
      AddDeletionContests(edits, deleter, deletion, deeds, contests);
    }
  }
  const SideChanges& right = edits.Changes(SceneSide::kRight);
  for (const FileIDs* file_ids :
       {&edits.Changes(SceneSide::kLeft).changed, &edits.Changes(SceneSide::kLeft).added}) {
    for (const YAMLScalar* node : *file_ids) {
      if ((right.Changed(node) || right.Added(node)) && IsFatherContested(edits, node)) {
        contests.push_back(MakeFatherContest(edits, node));
      }
      if (right.Added(node) && IsOwnerContested(edits, node))
        contests.push_back(MakeOwnerContest(edits, node));
    }
  }
  return contests;
}

}  // namespace vexel_yaml
