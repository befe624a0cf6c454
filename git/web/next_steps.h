#pragma once

#include <string>
#include <vector>

#include "git/next_step.h"
#include "view/view_guide.h"

namespace vexel_yaml {

/// How to go on in git once everything on the page is saved.
NextStep AfterAll(const GitStep& step);

/// The same for git mergetool, which may go on by itself.
NextStep AfterOne(const GitStep& step);

/// How to open these files again with a command, or all that are in conflict.
NextStep ToComeBack(const std::string& command, const std::vector<std::string>& files);

}  // namespace vexel_yaml
