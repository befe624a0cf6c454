#pragma once

#include <string>
#include <vector>

#include "platform/timer_stat.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

struct FileToRead {
  /// Names the step in timings; empty for a step that is not timed.
  std::string label;
  const std::string& path;
  VexelObjects& objects;
};

/// Reads the files, each on a thread of its own if `threads`. Where several fail, the first one's exception
/// is thrown, after all have ended. Keys that had to be left out are reported, a line each, on standard
/// error.
void ReadFiles(const std::vector<FileToRead>& files, bool threads, TimerStat& timer);

}  // namespace vexel_yaml
