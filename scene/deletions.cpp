#include "scene/deletions.h"

#include "scene/holders.h"

namespace vexel_yaml {

Deletions::Deletions(const VexelObjects& base, const std::vector<const YAMLScalar*>& removed) {
  const Holders holders(base, removed);
  std::unordered_map<const YAMLScalar*, const YAMLScalar*> tops;
  for (const YAMLScalar* file_id : removed) {
    std::vector<const YAMLScalar*> walk;
    const YAMLScalar* top = file_id;
    // A broken hierarchy may lead back to where the walk began: `tops` then knows it already.
    while (true) {
      const auto [known, is_new] = tops.emplace(top, top);
      if (!is_new) {
        top = known->second;
        break;
      }
      walk.push_back(top);
      const YAMLScalar* holder = holders.Get(top);
      if (holder == nullptr) break;
      top = holder;
    }
    for (const YAMLScalar* step : walk) tops[step] = top;
    const auto [place, is_new] = places_.emplace(top, deletions_.size());
    if (is_new) deletions_.push_back({top, {}});
    const size_t deletion = place->second;
    places_.emplace(file_id, deletion);
    deletions_[deletion].objects.push_back(file_id);
  }
}

size_t Deletions::Find(const YAMLScalar* file_id) const {
  const auto found = places_.find(file_id);
  return found == places_.end() ? kNone : found->second;
}

}  // namespace vexel_yaml
