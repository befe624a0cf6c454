#pragma once

#include <string>
#include <vector>

#include "view/settling.h"
#include "view/view_guide.h"

namespace vexel_yaml {

struct ViewServerOptions {
  /// 0 for any that is free.
  int port = 0;
  bool opens_browser = true;
  /// After so many seconds without a request the page is given up.
  int idle_seconds = 8 * 60 * 60;
};

/// Shows the files on one page in the person's browser, one after the other, until all are saved, or the page
/// is given up or closed. Prints its address as one line on standard output.
///
/// Returns 0 where all files were saved, or where nothing was to be saved (two versions that are compared),
/// else 1. A file that can't be read is shown as such, and named on standard error in the end. The rules and
/// the type information are loaded. Throws std::runtime_error where no file can be read or no port opened.
int RunViewServer(std::vector<ViewFile> files, const ViewServerOptions& options, ViewGuide guide);

}  // namespace vexel_yaml
