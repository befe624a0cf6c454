#pragma once

#include <string>

namespace vexel_yaml {

/// Starts the browser that the person prefers, and doesn't wait for it. Returns false where it can't be
/// started.
bool OpenBrowser(const std::string& address);

}  // namespace vexel_yaml
