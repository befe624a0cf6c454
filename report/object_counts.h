#pragma once

#include <cstddef>
#include <vector>

#include "report/report_cards.h"

namespace vexel_yaml {

/// What happened to the things of a file, each of which counts once: one that came or went as a whole, or
/// one in which something was changed.
struct ObjectCounts {
  size_t added = 0;
  size_t changed = 0;
  size_t removed = 0;
  /// Conflicts that nobody has settled.
  size_t pending = 0;

  void Add(const ReportCard& card);
};

ObjectCounts CountObjects(const std::vector<ReportCard>& cards);

}  // namespace vexel_yaml
