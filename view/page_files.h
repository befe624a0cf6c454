#pragma once

#include <string_view>

namespace vexel_yaml {

/// The text of page.html with its style and script, and the names by which a content security policy admits
/// these.
extern const std::string_view kViewPage;
extern const std::string_view kViewStyleHash;
extern const std::string_view kViewScriptHash;

}  // namespace vexel_yaml
