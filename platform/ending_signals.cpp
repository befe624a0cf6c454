#include "platform/ending_signals.h"

#include <pthread.h>
#include <unistd.h>

#include <atomic>

#include "platform/keep_until_exit.h"
#include "platform/temporary_files.h"

namespace vexel_yaml {

namespace {

constexpr int kEnding = -1;

// How many hold the signals back, or kEnding: then nobody may begin to.
std::atomic<int> holders = 0;
// The signal that waits for them.
std::atomic<int> waiting = 0;

// The signal is noted before the look at the holders, and a holder goes before it looks for the signal: so
// one of them sees the other.
extern "C" void TidyUpAndDie(int signal_number) {
  waiting = signal_number;
  int nobody = 0;
  if (!holders.compare_exchange_strong(nobody, kEnding) && signal_number != SIGABRT) return;
  UnlinkTempFiles();
  std::signal(signal_number, SIG_DFL);
  raise(signal_number);
}

}  // namespace

void HandleEndingSignals() {
  static const bool handled = [] {
    for (const int signal_number : kEndingSignals) {
      struct sigaction action = {};
      if (sigaction(signal_number, nullptr, &action) != 0 || action.sa_handler == SIG_IGN) continue;
      action.sa_handler = TidyUpAndDie;
      sigaction(signal_number, &action, nullptr);
    }
    return true;
  }();
  static_cast<void>(handled);
}

SignalsHeld::SignalsHeld() {
  HandleEndingSignals();
  sigset_t held;
  sigemptyset(&held);
  for (const int signal_number : kEndingSignals) sigaddset(&held, signal_number);
  int count = holders;
  while (count == kEnding || !holders.compare_exchange_weak(count, count + 1)) {
    // Another thread ends the process.
    if (count == kEnding) usleep(1000);
    count = holders;
  }
  pthread_sigmask(SIG_BLOCK, &held, &previous_);
}

SignalsHeld::~SignalsHeld() {
  const bool is_last = --holders == 0;
  pthread_sigmask(SIG_SETMASK, &previous_, nullptr);
  if (is_last && waiting != 0) raise(waiting);
}

void HoldSignalsToTheEnd() { KeepUntilExit(std::make_unique<SignalsHeld>()); }

}  // namespace vexel_yaml
