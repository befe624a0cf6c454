#pragma once

#include <cstdint>
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

/// What becomes of what mappings can't hold. Reported: keys that are no scalars are left out, with a line on
/// standard error for each, and so are pairs that are repeated with equal values. Refused: a key that is no
/// scalar makes a YAMLError that names file and object, and equal pairs stay, as repeated keys.
enum class Losses : uint8_t { kReported, kRefused };

/// Reads the files, each on a thread of its own if `threads`. Where several fail, the first one's exception
/// is thrown, after all have ended.
void ReadFiles(const std::vector<FileToRead>& files, bool threads, TimerStat& timer,
               Losses losses = Losses::kReported);

}  // namespace vexel_yaml
