#include "diff/diff_pair.h"

#include <exception>

#include "platform/thread.h"

namespace vexel_yaml {

namespace {

void DiffingThreadFunction(DiffingInfo& info, TimerStat& timer, const char* label) {
  TimerStat step(timer, label);
  info.diff = YAMLMappingDiff::Diff(info.from, info.to);
}

void SpawnDiffingThread(Thread& thread, DiffingInfo& info, TimerStat& timer, const char* label) {
  thread.Start([&info, &timer, label] { DiffingThreadFunction(info, timer, label); });
}

}  // namespace

DiffPair CreateDiffPair(DiffingInfo left, DiffingInfo right, bool threads, TimerStat& timer) {
  if (!threads) {
    DiffingThreadFunction(left, timer, "Creating left diff");
    DiffingThreadFunction(right, timer, "Creating right diff");
    return {left.diff, right.diff};
  }
  Thread left_thread;
  SpawnDiffingThread(left_thread, left, timer, "Creating left diff");
  std::exception_ptr right_exception;
  try {
    DiffingThreadFunction(right, timer, "Creating right diff");
  } catch (...) {
    right_exception = std::current_exception();
  }
  {
    TimerStat step(timer, "Waiting for left diff");
    left_thread.Join();
  }
  left_thread.CheckForExceptions();
  if (right_exception) std::rethrow_exception(right_exception);
  return {left.diff, right.diff};
}

}  // namespace vexel_yaml
