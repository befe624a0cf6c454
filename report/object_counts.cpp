#include "report/object_counts.h"

#include <algorithm>

namespace vexel_yaml {

void ObjectCounts::Add(const ReportCard& card) {
  // A component that came is a change of its game object.
  const auto whole = std::ranges::find(card.objects, card.file_id, &ReportObject::file_id);
  const bool is_added = whole != card.objects.end() && whole->added;
  const bool is_removed = whole != card.objects.end() && whole->removed;
  ++(is_added ? added : is_removed ? removed : changed);
  for (const ReportObject& object : card.objects) {
    pending += static_cast<size_t>(
        std::ranges::count_if(object.rows, [](const ReportRow& row) { return row.pending; }));
  }
}

ObjectCounts CountObjects(const std::vector<ReportCard>& cards) {
  ObjectCounts counts;
  for (const ReportCard& card : cards) counts.Add(card);
  return counts;
}

}  // namespace vexel_yaml
