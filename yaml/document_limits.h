#pragma once

#include <cstddef>
#include <string_view>

namespace vexel_yaml {

/// What the documents of one file have used up so far. The anchors that name the objects don't count, nor do
/// nodes that are written out: a large scene has millions.
struct DocumentLimits {
  size_t anchors = 0;
  size_t expanded_nodes = 0;
  size_t anchors_looked_at = 0;
  size_t brackets_looked_at = 0;

  bool operator==(const DocumentLimits&) const = default;
};

/// Throws YAMLError when the first document of `chunk`, which starts at `document_start` behind its
/// directives, is one that no person would write, or one too many of its kind:
/// "YAML nesting is deeper than 1000 levels", "YAML file holds more than 10000 anchors",
/// "YAML aliases expand to more than 10000000 nodes", "YAML aliases refer to too many anchors" or
/// "YAML nests too many values in brackets". To be asked before libyaml loads the text: its loading time
/// grows with the square of the depth and of the number of anchors, with the product of anchors and aliases,
/// and with the product of values and the brackets around them. A text that libyaml can't parse passes:
/// loading it reports why.
void CheckDocumentLimits(std::string_view chunk, size_t document_start, DocumentLimits& limits);

}  // namespace vexel_yaml
