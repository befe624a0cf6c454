#pragma once

#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace vexel_yaml {

/// What the lines of a record decide that people edit.

/// The line above them.
inline constexpr std::string_view kDecidedHeading = "Conflict handling:";

/// What a record's last section says, as a record file. What stands above comes from the sides of the merge,
/// and whatever it looks like, it decides nothing. A section that somebody has removed decides nothing, but
/// can be added to. Lines keep their numbers.
///
/// Of several lines for one place the last one counts: whoever changes their mind adds a line at the end,
/// while a record file goes by the first one. The lines of `first` count more than all others.
std::string DecidedIn(const std::string& record, const std::vector<std::string>& first = {});

/// Lines for people about choices for one of these places that a "#" makes comments of.
std::vector<std::string> DescribeCommentedChoices(const std::string& record,
                                                  const std::set<std::string>& places);

/// Whether a place fits a pattern, component by component: "*" stands for any one of them.
bool FitsPattern(const std::string& place, const std::string& pattern);

}  // namespace vexel_yaml
