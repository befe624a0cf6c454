#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Whether the program with the page is there, and somebody at a display to look at it. Build servers set CI:
/// some have a display, and nobody at it.
bool CanShowPage();

/// Goes on with a command in the program with the page, in place of this one: a web server in this one would
/// cost every merge of a small file more than the merge itself. Throws CommandError where that isn't there.
[[noreturn]] void GoOnOnPage(const std::string& command, const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
