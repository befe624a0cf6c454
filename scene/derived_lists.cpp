#include "scene/derived_lists.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <optional>
#include <unordered_map>
#include <unordered_set>

#include "diff/merge_tree_visitor.h"
#include "fixups/engine_keys.h"
#include "scene/merge_order.h"
#include "scene/object_links.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;
using Kind = ObjectLinks::Kind;

// An entry is a reference, or a mapping of one pair, whatever its name, around one.
const YAMLScalar* TargetOf(const YAMLNode* entry) {
  if (const YAMLScalar* target = GetLocalTarget(entry)) return target;
  const YAMLMapping* pair = entry == nullptr ? nullptr : entry->AsMapping();
  if (pair == nullptr || pair->HasDuplicateKeys() || pair->Size() != 1) return nullptr;
  return GetLocalTarget(pair->First());
}

const YAMLSequence* GetList(const VexelObjects& objects, const YAMLScalar* file_id, const YAMLScalar* key) {
  const YAMLMapping* body = GetBody(objects.Get(file_id));
  const YAMLNode* value = body == nullptr ? nullptr : body->Get(key);
  return value == nullptr ? nullptr : value->AsSequence();
}

// One list in one version.
struct ListVersion {
  const YAMLSequence* list = nullptr;
  FileIDs targets;
  std::unordered_map<const YAMLScalar*, const YAMLNode*> entries;

  ListVersion() = default;
  ListVersion(const VexelObjects& objects, const YAMLScalar* file_id, const YAMLScalar* key) {
    list = GetList(objects, file_id, key);
    if (list == nullptr) return;
    for (const YAMLNode* entry : list->GetItems()) {
      const YAMLScalar* target = TargetOf(entry);
      if (target != nullptr && entries.emplace(target, entry).second) targets.push_back(target);
    }
  }
};

// What a list holds in base, left and right.
using ListVersions = std::array<ListVersion, 3>;

class ListMaker {
 public:
  ListMaker(const SceneEdits& edits, const ScenePlan& plan, RecordingConflictResolver& resolver)
      : edits_(edits), plan_(plan), resolver_(resolver) {}

  std::vector<DerivedList> Make() {
    CollectConcerned();
    std::vector<DerivedList> lists;
    for (const Concerned& place : concerned_) {
      if (!plan_.Has(place.file_id)) continue;
      if (std::optional<DerivedList> list = MakeList(place)) lists.push_back(std::move(*list));
    }
    return lists;
  }

 private:
  struct Concerned {
    const YAMLScalar* file_id;
    const YAMLScalar* key;
    // What hangs there according to the edits, whatever the lists say.
    FileIDs members;
  };

  void CollectConcerned() {
    const SceneVersions& versions = edits_.versions;
    for (const SceneSide side : {SceneSide::kLeft, SceneSide::kRight}) {
      const SideChanges& changes = edits_.Changes(side);
      for (const YAMLScalar* file_id : changes.removed) LookAt(versions.base, file_id);
      for (const FileIDs* file_ids : {&changes.changed, &changes.added}) {
        for (const YAMLScalar* file_id : *file_ids) LookAt(edits_.Version(side), file_id);
      }
    }
  }

  // The object's own list, and that of what it hangs on.
  void LookAt(const VexelObjects& objects, const YAMLScalar* file_id) {
    if (!seen_.insert(file_id).second) return;
    const ObjectLinks links = ReadLinks(objects.Get(file_id));
    if (links.is_stripped) return;
    if (links.kind == Kind::kGameObject) At(file_id, YAMLScalar::mComponent);
    const bool is_part = links.kind == Kind::kComponent || links.kind == Kind::kTransform;
    if (is_part && links.owner != nullptr) {
      At(links.owner, YAMLScalar::mComponent);
      At(plan_.GetOwner(file_id), YAMLScalar::mComponent).members.push_back(file_id);
    }
    if (links.kind == Kind::kTransform) {
      At(file_id, ChildrenKey());
      for (const VexelObjects* version :
           {&edits_.versions.base, &edits_.versions.left, &edits_.versions.right}) {
        if (const YAMLScalar* father = FatherIn(*version, file_id)) At(father, ChildrenKey());
      }
      if (const YAMLScalar* father = plan_.GetFather(file_id)) {
        At(father, ChildrenKey()).members.push_back(file_id);
      }
    }
    // Its stripped root stands in the lists, without a word about where.
    if (links.kind == Kind::kPrefabInstance) {
      for (const VexelObjects* version :
           {&edits_.versions.base, &edits_.versions.left, &edits_.versions.right}) {
        if (const YAMLScalar* father = FatherIn(*version, file_id)) At(father, ChildrenKey());
      }
    }
  }

  Concerned& At(const YAMLScalar* file_id, const YAMLScalar* key) {
    auto& places = key == YAMLScalar::mComponent ? component_places_ : children_places_;
    const auto [place, is_new] = places.emplace(file_id, concerned_.size());
    if (is_new) concerned_.push_back({file_id, key, {}});
    return concerned_[place->second];
  }

  // Whether nothing was done to the list, and nothing else came or went: so it is for nearly all objects that
  // somebody edited.
  bool IsAsEver(const Concerned& place) const {
    const YAMLSequence* list = GetList(edits_.versions.base, place.file_id, place.key);
    if (list == nullptr) return false;
    for (const SceneSide side : {SceneSide::kLeft, SceneSide::kRight}) {
      if (edits_.Changes(side).LeftAlone(place.file_id)) continue;
      const YAMLSequence* other = GetList(edits_.Version(side), place.file_id, place.key);
      if (other == nullptr || !list->HasSameContent(*other)) return false;
    }
    std::unordered_set<const YAMLScalar*> listed;
    for (const YAMLNode* entry : list->GetItems()) {
      const YAMLScalar* target = TargetOf(entry);
      if (target != nullptr && listed.insert(target).second && !HangsAt(target, place)) return false;
    }
    return std::ranges::all_of(place.members,
                               [&](const YAMLScalar* member) { return listed.contains(member); });
  }

  ListVersions ReadVersions(const Concerned& place) const {
    const SceneVersions& versions = edits_.versions;
    return {ListVersion(versions.base, place.file_id, place.key),
            ListVersion(versions.left, place.file_id, place.key),
            ListVersion(versions.right, place.file_id, place.key)};
  }

  // Where the plan takes the object from one version, its order counts alone.
  ListVersions InPlan(const Concerned& place, const ListVersions& versions) const {
    const auto planned = plan_.GetObjects().find(place.file_id);
    if (planned == plan_.GetObjects().end()) return versions;
    const ListVersion version(plan_.Version(planned->second), place.file_id, place.key);
    return {version, version, version};
  }

  bool HangsAt(const YAMLScalar* file_id, const Concerned& place) const {
    if (!plan_.Has(file_id)) return false;
    if (place.key == YAMLScalar::mComponent) return plan_.GetOwner(file_id) == place.file_id;
    const ObjectLinks links = ReadLinks(Somewhere(file_id));
    const YAMLScalar* father = plan_.GetFather(file_id);
    // The root of a prefab instance hangs where the instance does.
    return (links.is_stripped && father != nullptr ? plan_.GetFather(father) : father) == place.file_id;
  }

  const YAMLNode* Somewhere(const YAMLScalar* file_id) const {
    const SceneVersions& versions = edits_.versions;
    for (const VexelObjects* version : {&versions.base, &versions.left, &versions.right}) {
      if (const YAMLNode* object = version->Get(file_id)) return object;
    }
    return nullptr;
  }

  FileIDs Members(const Concerned& place, const ListVersions& versions) const {
    FileIDs members;
    std::unordered_set<const YAMLScalar*> seen;
    const auto add = [&](const YAMLScalar* file_id) {
      if (seen.insert(file_id).second && HangsAt(file_id, place)) members.push_back(file_id);
    };
    for (const ListVersion& version : versions) std::ranges::for_each(version.targets, add);
    std::ranges::for_each(place.members, add);
    return members;
  }

  FileIDs Ordered(const Concerned& place, const YAMLScalar* body_key, const ListVersions& versions,
                  const FileIDs& members) {
    const auto& [base, left, right] = versions;
    const ThreeOrders<const YAMLScalar*> orders = {base.targets, left.targets, right.targets};
    const std::unordered_set<const YAMLScalar*> wanted(members.begin(), members.end());
    MergedOrder<const YAMLScalar*> merged = MergeOrder(orders, wanted);
    // The order of components means nothing.
    if (merged.is_conflict && place.key != YAMLScalar::mComponent) {
      const auto change = [](const ListVersion& side) {
        return MergeTreeCloneVisitor::Clone(YAMLAlloc<ChangeOperation>::create(side.list));
      };
      const MergeResolve side = resolver_.SettleConflict(
          {place.file_id, body_key, place.key}, ConflictType::kBothChange, change(left), change(right));
      merged = MergeOrder(orders, wanted, side);
    }
    // What no list names, though it says that it hangs here.
    const std::unordered_set<const YAMLScalar*> named(merged.order.begin(), merged.order.end());
    std::ranges::copy_if(members, std::back_inserter(merged.order),
                         [&](const YAMLScalar* member) { return !named.contains(member); });
    return std::move(merged.order);
  }

  // Nothing where the engine arrives at the same list.
  std::optional<DerivedList> MakeList(const Concerned& place) {
    if (IsAsEver(place)) return std::nullopt;
    const ListVersions all = ReadVersions(place);
    const ListVersions versions = InPlan(place, all);
    const ObjectLinks links = ReadLinks(Somewhere(place.file_id));
    const auto& [base, left, right] = versions;
    if (links.is_stripped || (left.list == nullptr && right.list == nullptr)) return std::nullopt;
    const FileIDs order = Ordered(place, links.body_key, versions, Members(place, all));
    // (But for the brackets of an empty list, which it would keep.)
    const bool keeps_style = base.targets.empty() == order.empty();
    if (keeps_style && left.targets == base.targets && order == right.targets) return std::nullopt;
    if (keeps_style && right.targets == base.targets && order == left.targets) return std::nullopt;
    OwnedNodePtr<YAMLSequence> list(YAMLAlloc<YAMLSequence>::create(order.empty()));
    for (const YAMLScalar* target : order) list->Append(MakeEntry(target, place.key, all));
    list->RebuildHash(false);
    return DerivedList{place.file_id, links.body_key, place.key, std::move(list)};
  }

  static YAMLNode* MakeEntry(const YAMLScalar* target, const YAMLScalar* key, const ListVersions& versions) {
    for (const ListVersion& version : versions) {
      const auto entry = version.entries.find(target);
      if (entry != version.entries.end()) return entry->second->Clone();
    }
    static const YAMLScalar* const component = YAMLScalar::Lookup("component");
    auto* reference = YAMLAlloc<YAMLMapping>::create(true);
    reference->Append(YAMLScalar::fileID, target->AsValue());
    if (key != YAMLScalar::mComponent) return reference;
    auto* entry = YAMLAlloc<YAMLMapping>::create(false);
    entry->Append(component, reference);
    return entry;
  }

  const SceneEdits& edits_;
  const ScenePlan& plan_;
  RecordingConflictResolver& resolver_;
  std::vector<Concerned> concerned_;
  std::unordered_map<const YAMLScalar*, size_t> children_places_;
  std::unordered_map<const YAMLScalar*, size_t> component_places_;
  std::unordered_set<const YAMLScalar*> seen_;
};

}  // namespace

std::vector<DerivedList> MakeDerivedLists(const SceneEdits& edits, const ScenePlan& plan,
                                          RecordingConflictResolver& resolver) {
  return ListMaker(edits, plan, resolver).Make();
}

}  // namespace vexel_yaml
