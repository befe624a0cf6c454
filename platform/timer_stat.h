#pragma once

#include <chrono>
#include <ostream>
#include <string>

namespace vexel_yaml {

/// Times one step of a command from its construction to its destruction, then prints a line:
/// two blanks for each level, the name, ": ", whole milliseconds. Inner steps end first, so they are listed
/// before the step that holds them.
class TimerStat {
 public:
  /// A root timer. `out` is not owned; null means silent.
  TimerStat(std::string name, std::ostream* out);

  /// A step inside `parent`, on the parent's stream.
  TimerStat(TimerStat& parent, std::string name);

  TimerStat(const TimerStat&) = delete;
  TimerStat& operator=(const TimerStat&) = delete;
  ~TimerStat();

 private:
  std::chrono::steady_clock::time_point start_;
  int depth_;
  std::ostream* out_;
  std::string name_;
};

}  // namespace vexel_yaml
