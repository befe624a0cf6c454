#pragma once

#include <set>
#include <string>
#include <vector>

#include "git/prompt.h"
#include "git/settle.h"

namespace vexel_yaml {

/// What `resolve` is told.
struct ResolveArguments {
  Choice choice;
  /// Whether to ask in the terminal, or to show a page.
  bool asks = false;
  bool shows_page = false;
  ColourUse colour = ColourUse::kAuto;
  /// For the page: its port, empty for any, and whether to start a browser.
  std::string port;
  bool opens_browser = true;
  std::vector<std::string> files;
};

/// Throws CommandError.
ResolveArguments ParseResolve(const std::vector<std::string>& arguments);

/// The files in conflict, from the top folder, that somebody has named, also one that is settled and staged;
/// all of them where none is named, or with -p and --web the only one that was. What is named and not found
/// has been said, and `is_complete` is false.
std::set<std::string> FindConflicts(const ResolveArguments& arguments, bool& is_complete);

}  // namespace vexel_yaml
