#include <csignal>
#include <exception>
#include <iostream>
#include <string>

#include "app/inner_main.h"
#include "platform/error_channel.h"

int main(int argc, char** argv) {
  // Dying of a closed pipe would leave temporary files behind; as a failed write it passes through the code.
  std::signal(SIGPIPE, SIG_IGN);
  try {
    const int status = vexel_yaml::InnerMain(vexel_yaml::CommandLineArguments(argv, argv + argc));
    // Whoever reads the output must not take a part of it for the whole.
    if (status == 0 && !std::cout.flush()) {
      vexel_yaml::WriteErrorLine("Cannot write to standard output");
      return 1;
    }
    return status;
  } catch (const std::exception& error) {
    vexel_yaml::WriteErrorLine(std::string("Uncaught exception: ") + error.what());
    return 1;
  }
}
