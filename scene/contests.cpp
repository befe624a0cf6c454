#include "scene/contests.h"

#include <algorithm>
#include <iterator>
#include <map>
#include <stdexcept>
#include <unordered_map>
#include <unordered_set>

#include "diff/merge_tree_visitor.h"
#include "fixups/component_dependencies.h"
#include "fixups/engine_keys.h"
#include "scene/holders.h"
#include "scene/object_links.h"
#include "yaml/folded_object.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;

// One thing that the other side did to something deleted.
struct Deed {
  enum class Kind : uint8_t { kEdited, kMovedOut, kAdded, kMovedIn, kRefers, kRequires };
  Kind kind;
  // The object in which it did it.
  const YAMLScalar* file_id;
  // The deleted object that this concerns.
  const YAMLScalar* object;
};

using Deeds = std::vector<Deed>;

FileIDs ObjectsOf(const Deeds& deeds, Deed::Kind kind) {
  FileIDs file_ids;
  for (const Deed& deed : deeds) {
    if (deed.kind == kind) file_ids.push_back(deed.file_id);
  }
  return file_ids;
}

FileIDs Joined(const FileIDs& a, const FileIDs& b) {
  FileIDs joined = a;
  joined.insert(joined.end(), b.begin(), b.end());
  return joined;
}

// The objects that an object refers to, lists that follow from others and its father aside.
std::unordered_set<const YAMLScalar*> OwnTargets(const YAMLNode* object) {
  std::unordered_set<const YAMLScalar*> targets;
  YAMLMapping* body = GetBody(const_cast<YAMLNode*>(object));
  if (body == nullptr) return targets;
  const YAMLMapping* father = GetFatherReference(const_cast<YAMLNode*>(object));
  const YAMLScalar* owner = ReadLinks(object).owner;
  for (const auto& [key, value] : *body) {
    if (key == ChildrenKey() || key == YAMLScalar::mComponent) continue;
    VisitReferences(value, [&](YAMLMapping& reference) {
      const YAMLScalar* target = GetLocalTarget(&reference);
      if (&reference != father && target != owner) targets.insert(target);
    });
  }
  return targets;
}

FileIDs ChildrenOf(const YAMLNode* object) {
  FileIDs children;
  const YAMLMapping* body = GetBody(object);
  if (body == nullptr) return children;
  VisitReferences(const_cast<YAMLNode*>(body->Get(ChildrenKey())),
                  [&](YAMLMapping& reference) { children.push_back(GetLocalTarget(&reference)); });
  return children;
}

// Whether the children that both have stand in another order.
bool AreChildrenReordered(const YAMLNode* base, const YAMLNode* side) {
  FileIDs before = ChildrenOf(base);
  FileIDs after = ChildrenOf(side);
  const std::unordered_set<const YAMLScalar*> in_before(before.begin(), before.end());
  const std::unordered_set<const YAMLScalar*> in_after(after.begin(), after.end());
  std::erase_if(before, [&](const YAMLScalar* child) { return !in_after.contains(child); });
  std::erase_if(after, [&](const YAMLScalar* child) { return !in_before.contains(child); });
  return before != after;
}

const YAMLTypeInfo* TypeIn(const VexelObjects& objects, const YAMLScalar* file_id) {
  const YAMLScalar* class_id = GetMappingPath(objects, file_id, YAMLScalar::classIDPlaceHolderName);
  return class_id == nullptr ? nullptr : GetTypeInfoManager().GetTypeInfo(class_id);
}

// The first component that a game object lists and that is of a type, null where there is none.
const YAMLScalar* FindComponent(const VexelObjects& objects, const YAMLScalar* game_object,
                                const YAMLScalar* type_id) {
  const YAMLMapping* body = GetBody(objects.Get(game_object));
  const YAMLScalar* component = nullptr;
  if (body == nullptr) return component;
  VisitReferences(const_cast<YAMLNode*>(body->Get(YAMLScalar::mComponent)), [&](YAMLMapping& reference) {
    const YAMLTypeInfo* type = TypeIn(objects, GetLocalTarget(&reference));
    if (component == nullptr && type != nullptr && std::ranges::count(LineageOf(*type), type_id) != 0) {
      component = GetLocalTarget(&reference);
    }
  });
  return component;
}

// Finds what the side that deleted nothing of it did to each thing that the other one deleted.
class DeedSearch {
 public:
  DeedSearch(const SceneEdits& edits, SceneSide deleter)
      : base_(edits.versions.base),
        other_(edits.Version(OtherSide(deleter))),
        changes_(edits.Changes(OtherSide(deleter))),
        kept_(edits.Version(deleter)),
        deleted_(edits.Deleted(deleter)),
        holders_(other_, Joined(changes_.added, edits.Changes(deleter).removed)) {}

  // By the places of the deletions.
  std::map<size_t, Deeds> Search() {
    // What both sides added, the one that deleted too, only refers to it: it comes and goes by itself.
    for (const YAMLScalar* file_id : changes_.added) {
      Add(kept_.HasKey(file_id) ? Deed::Kind::kRefers : Deed::Kind::kAdded, file_id, Reached(file_id));
    }
    for (const YAMLScalar* file_id : changes_.changed) {
      if (deleted_.Find(file_id) == Deletions::kNone) {
        LookAtMove(file_id);
      } else {
        LookAtEdit(file_id);
      }
    }
    for (const FileIDs* file_ids : {&changes_.changed, &changes_.added}) {
      for (const YAMLScalar* file_id : *file_ids) LookAtReferences(file_id);
    }
    for (const YAMLScalar* file_id : changes_.added) LookAtRequirements(file_id);
    return std::move(deeds_);
  }

 private:
  // `object`: null for none.
  void Add(Deed::Kind kind, const YAMLScalar* file_id, const YAMLScalar* object) {
    if (object != nullptr) deeds_[deleted_.Find(object)].push_back({kind, file_id, object});
  }

  // The deleted object that an object is or, as an addition, hangs on; null for none.
  const YAMLScalar* Reached(const YAMLScalar* file_id) const {
    std::unordered_set<const YAMLScalar*> passed;
    const YAMLScalar* step = file_id;
    while (step != nullptr && deleted_.Find(step) == Deletions::kNone) {
      step = passed.insert(step).second ? holders_.Get(step) : nullptr;
    }
    return step;
  }

  void LookAtMove(const YAMLScalar* file_id) {
    const YAMLScalar* father = FatherIn(other_, file_id);
    if (father != nullptr && father != FatherIn(base_, file_id)) {
      Add(Deed::Kind::kMovedIn, file_id, Reached(father));
    }
  }

  void LookAtEdit(const YAMLScalar* file_id) {
    const YAMLNode* edited = other_.Get(file_id);
    const YAMLScalar* father = FatherIn(other_, file_id);
    if (father != FatherIn(base_, file_id)) {
      const size_t deletion = deleted_.Find(file_id);
      const YAMLScalar* thing = deleted_.Get()[deletion].thing;
      const bool is_thing = file_id == thing || ReadLinks(edited).owner == thing;
      const YAMLScalar* reached = father == nullptr ? nullptr : Reached(father);
      const bool is_inside = reached != nullptr && deleted_.Find(reached) == deletion;
      if (!is_inside) Add(Deed::Kind::kMovedIn, file_id, reached);
      Add(is_thing || is_inside ? Deed::Kind::kEdited : Deed::Kind::kMovedOut, file_id, file_id);
    } else if (IsEdited(file_id, base_.Get(file_id), edited) ||
               AreChildrenReordered(base_.Get(file_id), edited)) {
      Add(Deed::Kind::kEdited, file_id, file_id);
    }
  }

  void LookAtReferences(const YAMLScalar* file_id) {
    if (deleted_.Get().empty()) return;
    std::unordered_set<const YAMLScalar*> known;
    bool has_looked = false;
    const YAMLScalar* reached = Reached(file_id);
    for (const YAMLScalar* target : OwnTargets(other_.Get(file_id))) {
      if (deleted_.Find(target) == Deletions::kNone) continue;
      // What was added to a thing comes and goes with it; a part of it may have been moved out, though.
      const bool is_inside = reached != nullptr && deleted_.Find(reached) == deleted_.Find(target);
      if (is_inside && reached != file_id) continue;
      if (!has_looked) known = OwnTargets(base_.Get(file_id));
      has_looked = true;
      if (!known.contains(target)) Add(Deed::Kind::kRefers, file_id, target);
    }
  }

  void LookAtRequirements(const YAMLScalar* file_id) {
    const YAMLTypeInfo* type = TypeIn(other_, file_id);
    const YAMLScalar* game_object = ReadLinks(other_.Get(file_id)).owner;
    if (type == nullptr || game_object == nullptr || Reached(file_id) != nullptr) return;
    for (const YAMLScalar* required : type->requires_types) {
      if (FindComponent(kept_, game_object, required) != nullptr) continue;
      const YAMLScalar* provider = FindComponent(base_, game_object, required);
      if (provider != nullptr && deleted_.Find(provider) != Deletions::kNone) {
        Add(Deed::Kind::kRequires, file_id, provider);
      }
    }
  }

  const VexelObjects& base_;
  const VexelObjects& other_;
  const SideChanges& changes_;
  // What the side that deleted has.
  const VexelObjects& kept_;
  const Deletions& deleted_;
  const Holders holders_;
  std::map<size_t, Deeds> deeds_;
};

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

// The parts that were moved out, each with what it consists of; none that lies in another one.
std::vector<std::pair<const YAMLScalar*, FileIDs>> MovedOutParts(const VexelObjects& base,
                                                                 const FileIDs& moved_out,
                                                                 const FileIDs& objects) {
  std::vector<std::pair<const YAMLScalar*, FileIDs>> parts;
  for (const YAMLScalar* node : moved_out) parts.emplace_back(node, CollectBelow(base, node, objects));
  std::vector<std::pair<const YAMLScalar*, FileIDs>> outermost;
  for (const auto& part : parts) {
    const bool is_inner = std::ranges::any_of(parts, [&](const auto& other) {
      return other.first != part.first && std::ranges::find(other.second, part.first) != other.second.end();
    });
    if (!is_inner) outermost.push_back(part);
  }
  return outermost;
}

// A part that was moved out is contested by itself, and the rest where something was done to it.
void AddDeletionContests(const SceneEdits& edits, SceneSide deleter, size_t deletion, const Deeds& deeds,
                         std::vector<Contest>& contests) {
  const Deletion& deleted = edits.Deleted(deleter).Get()[deletion];
  const auto parts =
      MovedOutParts(edits.versions.base, ObjectsOf(deeds, Deed::Kind::kMovedOut), deleted.objects);
  std::unordered_map<const YAMLScalar*, size_t> part_of;
  for (size_t i = 0; i < parts.size(); ++i) {
    for (const YAMLScalar* file_id : parts[i].second) part_of.emplace(file_id, i);
  }
  const auto place_of = [&](const YAMLScalar* file_id) {
    const auto found = part_of.find(file_id);
    return found == part_of.end() ? parts.size() : found->second;
  };
  // The rest is the last one.
  std::vector<Deeds> deeds_at(parts.size() + 1);
  for (const Deed& deed : deeds) deeds_at[place_of(deed.object)].push_back(deed);
  for (size_t i = 0; i < parts.size(); ++i) {
    const auto& [node, objects] = parts[i];
    const YAMLScalar* owner = ReadLinks(edits.versions.base.Get(node)).owner;
    contests.push_back(
        MakeDeletionContest(edits, deleter, deletion, owner == nullptr ? node : owner, objects, deeds_at[i]));
  }
  if (deeds_at.back().empty()) return;
  FileIDs rest;
  std::ranges::copy_if(deleted.objects, std::back_inserter(rest),
                       [&](const YAMLScalar* file_id) { return !part_of.contains(file_id); });
  contests.push_back(
      MakeDeletionContest(edits, deleter, deletion, deleted.thing, std::move(rest), deeds_at.back()));
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

SceneEdits::SceneEdits(const SceneVersions& scene)
    : versions(scene),
      changes{FindChanges(scene.base, scene.left), FindChanges(scene.base, scene.right)},
      deletions{Deletions(scene.base, changes[0].removed), Deletions(scene.base, changes[1].removed)} {}

const YAMLScalar* FatherIn(const VexelObjects& objects, const YAMLScalar* node) {
  const YAMLNode* object = objects.Get(node);
  const FoldedObject* folded = GetFolded(object);
  if (folded != nullptr && folded->father != nullptr) {
    return IsNullReference(folded->father) ? nullptr : folded->father;
  }
  return ReadLinks(object).father;
}

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
    if (edits.Deleted(deleter).Get().empty()) continue;
    for (const auto& [deletion, deeds] : DeedSearch(edits, deleter).Search()) {
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
