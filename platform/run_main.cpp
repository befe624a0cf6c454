#include "platform/run_main.h"

#include <csignal>
#include <exception>
#include <iostream>

#include "platform/error_channel.h"

namespace vexel_yaml {

int RunMain(int argc, char** argv, int (*run)(const std::vector<std::string>& arguments)) {
  // Dying of a closed pipe would leave temporary files behind; as a failed write it passes through the code.
  std::signal(SIGPIPE, SIG_IGN);
  try {
    const int status = run(std::vector<std::string>(argv, argv + argc));
    // Whoever reads the output must not take a part of it for the whole.
    if (status == 0 && !std::cout.flush()) {
      WriteErrorLine("Cannot write to standard output");
      return 1;
    }
    return status;
  } catch (const std::exception& error) {
    WriteErrorLine(std::string("Uncaught exception: ") + error.what());
    return 1;
  }
}

}  // namespace vexel_yaml
