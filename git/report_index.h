#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// A page that an index leads to.
struct IndexedPage {
  std::string asset;
  /// Where the page is, from the index's folder.
  std::string path;
  /// What vexel-merge-report --summary has printed of it.
  std::string counts;
};

/// An HTML page with a line for each of these pages. Nothing that a file is called becomes markup.
std::string IndexPage(const std::vector<IndexedPage>& pages);

}  // namespace vexel_yaml
