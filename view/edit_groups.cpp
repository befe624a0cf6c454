#include "view/edit_groups.h"

#include "scene/object_links.h"
#include "view/scene_excerpt.h"

namespace vexel_yaml {

EditGroups::EditGroups(const SceneDocuments& scene) {
  const std::unique_ptr<SceneDocuments> copy = scene.Copy();
  const Versions versions = {&copy->base, &copy->left, &copy->right};
  Group members = FindEdited(*copy);
  JoinLinked(versions, members);
  JoinReferring(versions, members);
  JoinCircles(versions);
  for (const YAMLScalar* file_id : members) {
    Group& group = groups_[Root(file_id)];
    group.push_back(file_id);
    group_of_.emplace(file_id, &group);
  }
}

void EditGroups::JoinLinked(const Versions& versions, Group& members) {
  std::unordered_set<const YAMLScalar*> known(members.begin(), members.end());
  for (const YAMLScalar* file_id : Group(members)) {
    std::array<ObjectLinks, 3> links;
    for (size_t i = 0; i < links.size(); ++i) links[i] = ReadLinks(versions[i]->Get(file_id));
    const auto is_elsewhere = [&](const ObjectLinks& link) {
      return link.kind != links[0].kind || link.father != links[0].father || link.owner != links[0].owner;
    };
    const bool has_moved = is_elsewhere(links[1]) || is_elsewhere(links[2]);
    if (has_moved) moved_.insert(file_id);
    for (const ObjectLinks& link : links) {
      if (link.owner != nullptr) Join(file_id, link.owner);
      if (!has_moved) continue;
      // Their lists follow.
      for (const YAMLScalar* holder : {link.owner, link.father}) {
        if (holder == nullptr) continue;
        Join(file_id, holder);
        if (known.insert(holder).second) members.push_back(holder);
      }
    }
  }
}

void EditGroups::JoinReferring(const Versions& versions, const Group& members) {
  const std::unordered_set<const YAMLScalar*> known(members.begin(), members.end());
  // What hangs where it always did shares nothing with its father: half a scene may hang there.
  const auto just_hangs = [&](const YAMLScalar* node, const YAMLScalar* father) {
    return !moved_.contains(node) && !moved_.contains(father) && FatherIn(*versions[0], node) == father;
  };
  for (const YAMLScalar* file_id : members) {
    for (const VexelObjects* version : versions) {
      // Reading references changes nothing.
      VisitReferences(const_cast<YAMLNode*>(version->Get(file_id)), [&](YAMLMapping& reference) {
        const YAMLScalar* target = GetLocalTarget(&reference);
        if (!known.contains(target) || just_hangs(file_id, target) || just_hangs(target, file_id)) return;
        Join(file_id, target);
      });
    }
  }
}

// Moves may form circles, whatever stands between them.
void EditGroups::JoinCircles(const Versions& versions) {
  for (const YAMLScalar* file_id : moved_) {
    for (const VexelObjects* version : versions) {
      std::unordered_set<const YAMLScalar*> passed;
      for (const YAMLScalar* step = FatherIn(*version, file_id);
           step != nullptr && passed.insert(step).second; step = FatherIn(*version, step)) {
        if (moved_.contains(step)) Join(file_id, step);
      }
    }
  }
}

const EditGroups::Group* EditGroups::Find(const YAMLScalar* file_id) const {
  const auto found = group_of_.find(file_id);
  return found == group_of_.end() ? nullptr : found->second;
}

const YAMLScalar* EditGroups::Root(const YAMLScalar* file_id) {
  while (true) {
    const YAMLScalar*& above = above_.try_emplace(file_id, file_id).first->second;
    if (above == file_id) return file_id;
    // Halves the way for who comes next.
    above = above_.at(above);
    file_id = above;
  }
}

}  // namespace vexel_yaml
