#include "platform/thread.h"

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

}  // namespace vexel_yaml
