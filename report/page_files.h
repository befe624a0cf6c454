#pragma once

#include <string_view>

namespace vexel_yaml {

/// The texts of page.css and page.js, and the names by which a content security policy admits them.
extern const std::string_view kPageStyle;
extern const std::string_view kPageStyleHash;
extern const std::string_view kPageScript;
extern const std::string_view kPageScriptHash;

}  // namespace vexel_yaml
