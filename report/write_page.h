#pragma once

#include <ostream>

#include "report/report_model.h"

namespace vexel_yaml {

/// What stands above the objects.
struct PageHead {
  std::string title;
  std::string base_path;
  std::string left_path;
  std::string right_path;
  /// Why the merge failed; empty where it didn't.
  std::string error;
  /// Whether it is shown what was committed in the end.
  bool shows_committed = false;
  /// Whether the sides are called theirs and ours, and not left and right; who is behind them may be known.
  bool are_theirs_and_ours = false;
  std::string theirs_name = {};
  std::string ours_name = {};
};

/// Writes one HTML page that needs no other file and no network. Texts may come from strangers: none of them
/// can become markup, style or script.
void WritePage(std::ostream& out, const PageHead& head, const std::vector<ReportObject>& objects);

}  // namespace vexel_yaml
