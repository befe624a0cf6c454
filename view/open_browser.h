#pragma once

#include <string>

namespace vexel_yaml {

/// Starts the browser that the person prefers, and doesn't wait for it. That none starts is no error.
void OpenBrowser(const std::string& address);

}  // namespace vexel_yaml
