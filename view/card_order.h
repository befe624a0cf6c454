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
  /// Puts the cards of a merge, and their rows, into that order. New cards go behind the ones that they came
  /// behind, new rows to the end of their object.
  void Arrange(std::vector<ReportCard>& cards);

 private:
  void ArrangeRows(ReportObject& object);

  // Also of cards that are gone, which may come back.
  std::vector<const YAMLScalar*> cards_;
  std::unordered_set<const YAMLScalar*> known_cards_;
  std::map<FieldPath, size_t> rows_;
};

}  // namespace vexel_yaml
