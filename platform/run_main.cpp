#include "platform/run_main.h"

#include <fcntl.h>
#include <unistd.h>

#include <csignal>
#include <exception>
#include <iostream>
#include <new>

#include "platform/error_channel.h"
#include "platform/hinted_error.h"
#include "platform/out_of_memory.h"
#include "platform/terminal_output.h"

namespace vexel_yaml {

namespace {

// A caller may have closed some: the first file opened would take the number, and get the messages. What
// stands in for them can't be written to, so that output that nobody gets stays an error.
void OpenStandardDescriptors() {
  int descriptor = STDIN_FILENO;
  while (descriptor >= 0 && descriptor <= STDERR_FILENO) descriptor = open("/dev/null", O_RDONLY);
  close(descriptor);
}

}  // namespace

bool FlushStandardOutput() {
  if (std::cout.flush()) return true;
  WriteErrorLine("Cannot write to standard output");
  return false;
}

int RunMain(int argc, char** argv, int (*run)(const std::vector<std::string>& arguments)) {
  OpenStandardDescriptors();
  // Dying of a closed pipe would leave temporary files behind; as a failed write it passes through the code.
  std::signal(SIGPIPE, SIG_IGN);
  const TerminalOutput output(std::cout, STDOUT_FILENO);
  const TerminalOutput errors(std::cerr, STDERR_FILENO);
  try {
    const int status = run(std::vector<std::string>(argv, argv + argc));
    // Whoever reads the output must not take a part of it for the whole. What has failed has its message.
    return status == 1 || FlushStandardOutput() ? status : 1;
  } catch (const std::bad_alloc&) {
    EndOutOfMemory();
  } catch (const HintedError& error) {
    WriteErrorLine(std::string("Uncaught exception: ") + error.what());
    WriteHint(error.GetHint());
    return 1;
  } catch (const std::exception& error) {
    WriteErrorLine(std::string("Uncaught exception: ") + error.what());
    return 1;
  }
}

}  // namespace vexel_yaml
