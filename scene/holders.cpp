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

std::vector<const YAMLScalar*> CollectBelow(const VexelObjects& objects, const YAMLScalar* node,
                                            const std::vector<const YAMLScalar*>& among) {
  const Holders holders(objects, among);
  const ObjectLinks links = ReadLinks(objects.Get(node));
  const YAMLScalar* top = links.owner == nullptr ? node : links.owner;
  std::unordered_map<const YAMLScalar*, bool> is_below = {{top, true}};
  std::vector<const YAMLScalar*> below;
  for (const YAMLScalar* file_id : among) {
    std::vector<const YAMLScalar*> walk;
    const YAMLScalar* step = file_id;
    while (step != nullptr && is_below.emplace(step, false).second) {
      walk.push_back(step);
      step = holders.Get(step);
    }
    const bool found = step != nullptr && is_below.at(step);
    for (const YAMLScalar* passed : walk) is_below[passed] = found;
    if (found || is_below.at(file_id)) below.push_back(file_id);
  }
  return below;
}

}  // namespace vexel_yaml
