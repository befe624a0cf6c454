#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Writes pages with vexel-merge-report, of the conflicts at hand or of a merge commit, and prints where they
/// are. Returns 0, or 1 where a page is missing. Throws CommandError.
int RunReportPages(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
