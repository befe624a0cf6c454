#include "platform/thread.h"

#include <sys/stat.h>

#include <system_error>
#include <utility>

namespace vexel_yaml {

Thread::~Thread() { Join(); }

void Thread::Start(std::function<void()> function) {
  function_ = std::move(function);
  try {
    handle_ = std::thread(Thread_Helper, this);
  } catch (const std::system_error&) {
    Thread_Helper(this);
  }
}

void Thread::Join() {
  if (handle_.joinable()) handle_.join();
}

void Thread::CheckForExceptions() {
  if (exception_) std::rethrow_exception(exception_);
}

void Thread::Thread_Helper(Thread* self) {
  try {
    self->function_();
  } catch (...) {
    self->exception_ = std::current_exception();
  }
}

void RunBoth(bool threads, const std::function<void()>& first, const std::function<void()>& second) {
  Thread thread;
  if (threads) {
    thread.Start(first);
  } else {
    first();
  }
  second();
  thread.Join();
  thread.CheckForExceptions();
}

bool AreWorthThreads(const std::vector<std::string>& paths) {
  constexpr off_t kManyBytes = 1 << 18;
  off_t bytes = 0;
  for (const std::string& path : paths) {
    struct stat status = {};
    if (stat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode)) return true;
    bytes += status.st_size;
  }
  return bytes >= kManyBytes;
}

}  // namespace vexel_yaml
