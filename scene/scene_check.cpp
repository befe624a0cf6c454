#include "scene/scene_check.h"

#include <map>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "scene/object_links.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

using Kind = ObjectLinks::Kind;

class SceneChecker {
 public:
  explicit SceneChecker(const VexelObjects& objects, const SameAsIn* same = nullptr)
      : objects_(objects), same_(same) {}

  void Check(const YAMLScalar* file_id) {
    const YAMLNode* object = Get(file_id);
    const YAMLMapping* body = GetBody(object);
    if (body == nullptr) return;
    file_id_ = file_id;
    const ObjectLinks links = ReadLinks(object);
    if (links.owner != nullptr && !objects_.HasKey(links.owner)) {
      Add("is a part of " + links.owner->GetText() + ", which isn't there");
    } else if (!links.is_stripped && (links.kind == Kind::kTransform || links.kind == Kind::kComponent)) {
      CheckListed(links.owner, YAMLScalar::mComponent, "component");
    }
    if (links.HasFather()) CheckFather(links);
    if (!links.is_stripped && links.kind == Kind::kGameObject) CheckComponents(*body);
    if (!links.is_stripped && links.kind == Kind::kTransform) CheckChildren(*body);
    VisitReferences(const_cast<YAMLMapping*>(body), [&](YAMLMapping& reference) {
      const YAMLScalar* target = GetLocalTarget(&reference);
      if (!objects_.HasKey(target)) Add("refers to " + target->GetText() + ", which isn't there");
    });
  }

  std::vector<SceneFault> Take() { return std::move(faults_); }

 private:
  const YAMLNode* Get(const YAMLScalar* file_id) const {
    return (same_ != nullptr && same_->is_same(file_id) ? same_->objects : objects_).Get(file_id);
  }

  void Add(std::string text) { faults_.push_back({file_id_, std::move(text)}); }

  // How often the list of another object names this one.
  void CheckListed(const YAMLScalar* holder, const YAMLScalar* key, const std::string& what) {
    if (holder == nullptr) return;
    const YAMLNode* object = Get(holder);
    const YAMLMapping* body = GetBody(object);
    // A stripped object has no lists.
    if (body == nullptr || ReadLinks(object).is_stripped) return;
    const auto [known, is_new] = listed_.try_emplace({holder, key});
    if (is_new) {
      for (const YAMLScalar* target : Targets(*body, key)) ++known->second[target];
    }
    const size_t count = known->second.contains(file_id_) ? known->second.at(file_id_) : 0;
    if (count == 1) return;
    Add((count == 0 ? "is no " + what : "is a " + what + " twice") + " in the list of " + holder->GetText());
  }

  void CheckFather(const ObjectLinks& links) {
    if (links.father == nullptr) return;
    if (!objects_.HasKey(links.father)) {
      Add("hangs below " + links.father->GetText() + ", which isn't there");
      return;
    }
    std::unordered_set<const YAMLScalar*> passed;
    const YAMLScalar* step = links.father;
    while (step != nullptr && step != file_id_ && !rooted_.contains(step) && passed.insert(step).second) {
      step = FatherIn(objects_, step);
    }
    if (step == file_id_) {
      Add("hangs below itself");
    } else if (step == nullptr || rooted_.contains(step)) {
      rooted_.insert(passed.begin(), passed.end());
    }
    if (links.kind == Kind::kTransform && !links.is_stripped)
      CheckListed(links.father, ChildrenKey(), "child");
  }

  void CheckComponents(const YAMLMapping& body) {
    size_t transforms = 0;
    for (const YAMLScalar* target : Targets(body, YAMLScalar::mComponent)) {
      const ObjectLinks links = ReadLinks(Get(target));
      transforms += links.kind == Kind::kTransform ? 1 : 0;
      if (objects_.HasKey(target) && links.owner != file_id_) {
        Add("lists the component " + target->GetText() + ", which is none of it");
      }
    }
    if (transforms != 1) Add("has " + std::to_string(transforms) + " transforms");
  }

  void CheckChildren(const YAMLMapping& body) {
    for (const YAMLScalar* target : Targets(body, ChildrenKey())) {
      const ObjectLinks links = ReadLinks(Get(target));
      const YAMLScalar* father =
          links.is_stripped && links.father != nullptr ? FatherIn(objects_, links.father) : links.father;
      if (objects_.HasKey(target) && father != file_id_) {
        Add("lists the child " + target->GetText() + ", which is none of it");
      }
    }
  }

  static std::vector<const YAMLScalar*> Targets(const YAMLMapping& body, const YAMLScalar* key) {
    std::vector<const YAMLScalar*> targets;
    VisitReferences(const_cast<YAMLNode*>(body.Get(key)),
                    [&](YAMLMapping& reference) { targets.push_back(GetLocalTarget(&reference)); });
    return targets;
  }

  const VexelObjects& objects_;
  const SameAsIn* same_;
  const YAMLScalar* file_id_ = nullptr;
  // How often the lists that were asked name each object.
  std::map<std::pair<const YAMLScalar*, const YAMLScalar*>, std::unordered_map<const YAMLScalar*, size_t>>
      listed_;
  // What is known to hang at the top, in the end.
  std::unordered_set<const YAMLScalar*> rooted_;
  std::vector<SceneFault> faults_;
};

}  // namespace

std::vector<SceneFault> CheckScene(const VexelObjects& objects,
                                   const std::vector<const YAMLScalar*>& file_ids) {
  SceneChecker checker(objects);
  for (const YAMLScalar* file_id : file_ids) checker.Check(file_id);
  return checker.Take();
}

std::vector<SceneFault> CheckScene(const VexelObjects& objects, const SameAsIn& same,
                                   const std::vector<const YAMLScalar*>& file_ids) {
  SceneChecker checker(objects, &same);
  for (const YAMLScalar* file_id : file_ids) checker.Check(file_id);
  return checker.Take();
}

std::vector<SceneFault> CheckScene(const VexelObjects& objects) {
  SceneChecker checker(objects);
  for (const auto& [file_id, object] : objects) checker.Check(file_id);
  return checker.Take();
}

}  // namespace vexel_yaml
