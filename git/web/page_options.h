#pragma once

#include <string>
#include <vector>

#include "git/settings.h"
#include "view/view_server.h"

namespace vexel_yaml {

/// What the options of a command mean for its page; an empty port is any. Throws CommandError.
ViewServerOptions PageOptions(const std::string& port, bool opens_browser);

/// Loads the rules and the type information. Throws CommandError where they can't be read.
void LoadForPage(const MergeSettings& settings);

/// Shows the files. Returns the exit status. Throws CommandError where the first one can't be read, or there
/// is no port.
int ShowPage(std::vector<ViewFile> files, const ViewServerOptions& options, ViewGuide guide);

}  // namespace vexel_yaml
