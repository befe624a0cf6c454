#pragma once

#include <array>
#include <csignal>

namespace vexel_yaml {

/// What a person, another program, the system's shutdown, a failed check or a limit on file size or time ends
/// the process with, in time to tidy up.
inline constexpr std::array kEndingSignals = {SIGHUP,  SIGINT,  SIGQUIT, SIGTERM, SIGABRT,
                                              SIGALRM, SIGUSR1, SIGUSR2, SIGXFSZ, SIGXCPU};

/// Tidies up before one of these signals ends the process, unless the caller has switched it off (nohup).
void HandleEndingSignals();

/// Holds these signals back in its lifetime, for steps that must not end half way: from the whole process,
/// whose other threads may be waiting for something else, and from the programs that this thread starts. The
/// end comes with the last one that holds them. A failed check alone (SIGABRT) ends the process at once.
class SignalsHeld {
 public:
  SignalsHeld();
  SignalsHeld(const SignalsHeld&) = delete;
  SignalsHeld& operator=(const SignalsHeld&) = delete;
  ~SignalsHeld();

 private:
  sigset_t previous_;
};

/// Holds them back for the rest of the process, which is about to end, and with success: for what its caller
/// would undo otherwise.
void HoldSignalsToTheEnd();

}  // namespace vexel_yaml
