#pragma once

#include <string>

namespace vexel_yaml {

/// Shows a notice with that title and text (both UTF-8) on the user's desktop and returns at once.
/// Does nothing on a system without a notice service.
void ShowErrorDialog(const std::string& title, const std::string& text);

}  // namespace vexel_yaml
