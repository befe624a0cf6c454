#include "scene/execute_plan.h"

#include <array>
#include <unordered_map>
#include <unordered_set>

#include "scene/object_links.h"
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

  void Execute(const std::vector<DerivedList>& lists) {
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

}  // namespace

void ExecutePlan(const ScenePlan& plan, const std::vector<DerivedList>& lists,
                 const SceneVersions& versions) {
  PlanExecution(versions, plan).Execute(lists);
}

}  // namespace vexel_yaml
