#include "platform/timer_stat.h"

#include <utility>

#include "platform/mutex.h"

namespace vexel_yaml {

TimerStat::TimerStat(std::string name, std::ostream* out)
    : start_(std::chrono::steady_clock::now()), depth_(0), out_(out), name_(std::move(name)) {}

TimerStat::TimerStat(TimerStat& parent, std::string name)
    : start_(std::chrono::steady_clock::now()),
      depth_(parent.depth_ + 1),
      out_(parent.out_),
      name_(std::move(name)) {}

TimerStat::~TimerStat() {
  if (out_ == nullptr) return;
  const auto elapsed =
      std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - start_);
  const std::string indent(2 * static_cast<size_t>(depth_), ' ');
  // Two threads may end a step at once, and what escapes for a terminal takes one character after another.
  static Mutex printing;
  AutoLock lock(printing);
  *out_ << indent + name_ + ": " + std::to_string(elapsed.count()) + "\n" << std::flush;
}

}  // namespace vexel_yaml
