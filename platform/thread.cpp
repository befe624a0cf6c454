#include "platform/thread.h"

#include <utility>

namespace vexel_yaml {

Thread::~Thread() {
  if (handle_.joinable()) handle_.join();
}

void Thread::Start(std::function<void()> function) {
  function_ = std::move(function);
  handle_ = std::thread(Thread_Helper, this);
}

void Thread::Join() { handle_.join(); }

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
