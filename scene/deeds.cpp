#include "scene/deeds.h"

#include <algorithm>
#include <optional>
#include <unordered_map>
#include <unordered_set>

#include "fixups/component_dependencies.h"
#include "fixups/engine_keys.h"
#include "scene/holders.h"
#include "scene/new_targets.h"
#include "scene/object_links.h"
#include "scene/place_walk.h"
#include "scene/same_fields.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;
using Deeds = std::vector<Deed>;

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
  const ObjectLinks links = ReadLinks(object);
  const YAMLScalar* owner = links.owner;
  for (const auto& [key, value] : *body) {
    if (IsLink({nullptr, nullptr, key}, links.kind)) continue;
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
  if (body == nullptr || ReadLinks(object).kind != ObjectLinks::Kind::kTransform) return children;
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
        deleter_changes_(edits.Changes(deleter)),
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
    for (const YAMLScalar* file_id : changes_.changed) {
      if (deleter_changes_.Changed(file_id)) LookAtEntries(file_id);
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
  const YAMLScalar* Reached(const YAMLScalar* file_id) {
    FileIDs walk;
    const YAMLScalar* step = file_id;
    const YAMLScalar* reached = nullptr;
    while (step != nullptr) {
      if (deleted_.Find(step) != Deletions::kNone) {
        reached = step;
        break;
      }
      // In a circle the walk meets itself, and has reached nothing.
      const auto [known, is_new] = reached_.emplace(step, nullptr);
      if (!is_new) {
        reached = known->second;
        break;
      }
      walk.push_back(step);
      step = holders_.Get(step);
    }
    for (const YAMLScalar* passed : walk) reached_[passed] = reached;
    return reached;
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
    std::optional<std::unordered_set<const YAMLScalar*>> added;
    const YAMLScalar* reached = Reached(file_id);
    for (const YAMLScalar* target : OwnTargets(other_.Get(file_id))) {
      if (deleted_.Find(target) == Deletions::kNone) continue;
      // What was added to a thing comes and goes with it; a part of it may have been moved out, though.
      const bool is_inside = reached != nullptr && deleted_.Find(reached) == deleted_.Find(target);
      if (is_inside && reached != file_id) continue;
      if (!added) added = FindNewTargets(file_id, base_.Get(file_id), other_.Get(file_id));
      if (added->contains(target)) Add(Deed::Kind::kRefers, file_id, target);
    }
  }

  // An entry that the deleter took out of a list, and that this side edited, is a part of what it stands for.
  void LookAtEntries(const YAMLScalar* file_id) {
    const IsSought is_deleted = [&](const YAMLScalar* target) {
      return deleted_.Find(target) != Deletions::kNone;
    };
    const auto look_at = [&](const ListPlace& list) {
      if (list.other == nullptr) return;
      for (const AlignedElement& element : list.elements) {
        if (element.base == kNoIndex || element.left != kNoIndex || element.right == kNoIndex) continue;
        const YAMLNode* entry = list.base.GetItems()[element.base];
        const YAMLNode* now = list.other->GetItems()[element.right];
        const YAMLScalar* target = TargetOf(entry, is_deleted);
        if (target == nullptr || IsAnotherReference(entry, now)) continue;
        list.path.push_back(YAMLScalar::Lookup(IntToString(static_cast<int>(element.base))));
        const bool is_edited = !HaveSameFields(list.path, entry, now);
        list.path.pop_back();
        if (is_edited) Add(Deed::Kind::kRefers, file_id, target);
      }
    };
    PlaceWalk(
        is_deleted, [](const YAMLMapping&, const YAMLMapping&, const YAMLMapping*) {}, look_at)
        .Walk(file_id, base_.Get(file_id), const_cast<YAMLNode*>(kept_.Get(file_id)),
              const_cast<YAMLNode*>(other_.Get(file_id)));
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
  const SideChanges& deleter_changes_;
  const Deletions& deleted_;
  const Holders holders_;
  // Of what was asked already.
  std::unordered_map<const YAMLScalar*, const YAMLScalar*> reached_;
  std::map<size_t, Deeds> deeds_;
};

}  // namespace

std::map<size_t, Deeds> FindDeeds(const SceneEdits& edits, SceneSide deleter) {
  if (edits.Deleted(deleter).Get().empty()) return {};
  return DeedSearch(edits, deleter).Search();
}

}  // namespace vexel_yaml
