#include "view/shown_names.h"

#include <algorithm>

#include "scene/object_links.h"

namespace vexel_yaml {

void ShownNames::Add(const ReportObject& object) {
  std::unordered_set<const YAMLScalar*>& named = named_[object.file_id];
  named.insert(object.file_id);
  for (const ReportRow& row : object.rows) {
    for (const ReportCell* cell : {&row.base, &row.left, &row.right, &row.result}) {
      VisitReferences(const_cast<YAMLNode*>(cell->node),
                      [&](YAMLMapping& reference) { named.insert(GetLocalTarget(&reference)); });
    }
  }
}

std::vector<const YAMLScalar*> ShownNames::Showing(
    const ObjectNames& names, const std::unordered_set<const YAMLScalar*>& renamed) const {
  std::unordered_map<const YAMLScalar*, bool> is_below;
  const auto is_renamed = [&](const YAMLScalar* file_id) {
    std::vector<const YAMLScalar*> walk;
    bool found = false;
    for (const YAMLScalar* step = names.GetWhole(file_id); step != nullptr; step = names.GetParent(step)) {
      // In a circle the walk meets itself.
      const auto [known, is_new] = is_below.emplace(step, renamed.contains(step));
      if (is_new) walk.push_back(step);
      found = known->second;
      if (found || !is_new) break;
    }
    for (const YAMLScalar* step : walk) is_below[step] = found;
    return found;
  };
  std::vector<const YAMLScalar*> showing;
  for (const auto& [file_id, named] : named_) {
    if (std::ranges::any_of(named, is_renamed)) showing.push_back(file_id);
  }
  return showing;
}

}  // namespace vexel_yaml
