#include "scene/holders.h"

#include "scene/object_links.h"

namespace vexel_yaml {

Holders::Holders(const VexelObjects& objects, const std::vector<const YAMLScalar*>& among)
    : among_(among.begin(), among.end()) {
  for (const YAMLScalar* file_id : among) {
    const ObjectLinks links = ReadLinks(objects.Get(file_id));
    Hold(file_id, links.owner);
    if (links.kind == ObjectLinks::Kind::kPrefabInstance) Hold(file_id, links.father);
    if (links.kind != ObjectLinks::Kind::kTransform || links.is_stripped) continue;
    // The game object hangs where its transform does.
    Hold(links.owner == nullptr ? file_id : links.owner, links.father);
  }
}

const YAMLScalar* Holders::Get(const YAMLScalar* file_id) const {
  const auto found = holders_.find(file_id);
  return found == holders_.end() ? nullptr : found->second;
}

void Holders::Hold(const YAMLScalar* file_id, const YAMLScalar* holder) {
  if (holder != nullptr && holder != file_id && among_.contains(holder)) holders_.emplace(file_id, holder);
}

std::unordered_map<const YAMLScalar*, const YAMLScalar*> FindTops(
    const Holders& holders, const std::vector<const YAMLScalar*>& objects,
    const std::unordered_set<const YAMLScalar*>& tops) {
  std::unordered_map<const YAMLScalar*, const YAMLScalar*> found;
  for (const YAMLScalar* file_id : objects) {
    std::vector<const YAMLScalar*> walk;
    const YAMLScalar* step = file_id;
    while (step != nullptr && found.emplace(step, nullptr).second) {
      walk.push_back(step);
      step = holders.Get(step);
    }
    const YAMLScalar* top = step == nullptr ? nullptr : found.at(step);
    for (auto passed = walk.rbegin(); passed != walk.rend(); ++passed) {
      if (top == nullptr && tops.contains(*passed)) top = *passed;
      found[*passed] = top;
    }
  }
  return found;
}

}  // namespace vexel_yaml
