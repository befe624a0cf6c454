#include "view/card_order.h"

#include <algorithm>

namespace vexel_yaml {

void CardOrder::Arrange(std::vector<ReportCard>& cards) {
  const YAMLScalar* previous = nullptr;
  for (ReportCard& card : cards) {
    for (ReportObject& object : card.objects) ArrangeRows(object);
    if (known_cards_.insert(card.file_id).second) {
      const auto behind = std::ranges::find(cards_, previous);
      cards_.insert(behind == cards_.end() ? cards_.end() : behind + 1, card.file_id);
    }
    previous = card.file_id;
  }
}

void CardOrder::ArrangeRows(ReportObject& object) {
  for (const ReportRow& row : object.rows) rows_.emplace(row.path, rows_.size());
  std::ranges::sort(object.rows, {}, [&](const ReportRow& row) { return rows_.at(row.path); });
}

}  // namespace vexel_yaml
