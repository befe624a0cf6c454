#pragma once

#include <cstddef>
#include <string_view>

namespace vexel_yaml {

/// Throws YAMLError "YAML nesting is deeper than 1000 levels" when the first document of `text` is. To be
/// asked before libyaml loads the text, since its loading time grows with the square of the depth.
/// A text that libyaml can't parse passes: loading it reports why.
void CheckNestingDepth(std::string_view text);

}  // namespace vexel_yaml
