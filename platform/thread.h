#pragma once

#include <exception>
#include <functional>
#include <string>
#include <thread>
#include <vector>

namespace vexel_yaml {

/// Runs one function on a thread of its own and carries its exception back to the thread that joins it.
class Thread {
 public:
  Thread() = default;
  Thread(const Thread&) = delete;
  Thread& operator=(const Thread&) = delete;

  /// Joins a thread that is still running, so that an exception between start and join ends no process.
  ~Thread();

  /// Starts `function`. One function a `Thread`. Where the system has no thread left, the function runs at
  /// once on the calling one: a machine that is short of threads still merges.
  void Start(std::function<void()> function);

  /// Waits for the function to return. Throws nothing that it threw.
  void Join();

  /// After `Join`: throws again what the function threw, if it did.
  void CheckForExceptions();

 private:
  static void Thread_Helper(Thread* self);

  std::thread handle_;
  std::function<void()> function_;
  std::exception_ptr exception_;
};

/// Runs two functions that share nothing that either changes: at the same time if `threads`, the second on
/// the calling thread. Throws what they threw, the second first.
void RunBoth(bool threads, const std::function<void()>& first, const std::function<void()>& second);

/// Whether threads bring more than they cost where these files are read, compared and written. A thread has
/// storage of its own to set up and to give back, which takes as long as reading some ten kilobytes. True
/// also where a size isn't known, as that of a pipe.
bool AreWorthThreads(const std::vector<std::string>& paths);

}  // namespace vexel_yaml
