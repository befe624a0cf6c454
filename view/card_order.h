#pragma once

#include <map>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "report/report_cards.h"

namespace vexel_yaml {

/// Keeps cards and their rows where they were first shown: what somebody has just settled must not jump away.
class CardOrder {
 public:
  /// Puts the rows of the cards of a merge into that order, and the keys of new cards behind the ones that
  /// they came behind; new rows go to the end of their object.
  void Arrange(std::vector<ReportCard>& cards);

  /// The keys of all cards that ever were, in their order.
  const std::vector<const YAMLScalar*>& GetKeys() const { return cards_; }

 private:
  void ArrangeRows(ReportObject& object);

  // Also of cards that are gone, which may come back.
  std::vector<const YAMLScalar*> cards_;
  std::unordered_set<const YAMLScalar*> known_cards_;
  std::map<FieldPath, size_t> rows_;
};

}  // namespace vexel_yaml
