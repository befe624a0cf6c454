#pragma once

#include <pthread.h>

#include <array>
#include <csignal>

namespace vexel_yaml {

/// What a person, another program, the system's shutdown, a failed check or a limit on file size or time ends
/// the process with, in time to tidy up.
inline constexpr std::array kEndingSignals = {SIGHUP,  SIGINT,  SIGQUIT, SIGTERM, SIGABRT,
                                              SIGALRM, SIGUSR1, SIGUSR2, SIGXFSZ, SIGXCPU};

/// Holds these signals back from the calling thread in its lifetime, for steps that must not end half way.
class SignalsHeld {
 public:
  SignalsHeld() {
    sigset_t held;
    sigemptyset(&held);
    for (const int signal_number : kEndingSignals) sigaddset(&held, signal_number);
    pthread_sigmask(SIG_BLOCK, &held, &previous_);
  }
  SignalsHeld(const SignalsHeld&) = delete;
  SignalsHeld& operator=(const SignalsHeld&) = delete;
  ~SignalsHeld() { pthread_sigmask(SIG_SETMASK, &previous_, nullptr); }

 private:
  sigset_t previous_;
};

}  // namespace vexel_yaml
