#pragma once

#include <cstddef>
#include <string_view>

namespace vexel_yaml {

/// Throws YAMLError when the first document of `text` is one that no person would write:
/// "YAML nesting is deeper than 1000 levels", "YAML document holds more than 10000 anchors" or
/// "YAML aliases expand to more than 10000000 nodes". To be asked before libyaml loads the text: its loading
/// time grows with the square of the depth and of the number of anchors.
/// A text that libyaml can't parse passes: loading it reports why.
void CheckDocumentLimits(std::string_view text);

}  // namespace vexel_yaml
