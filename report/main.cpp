#include <csignal>
#include <exception>
#include <iostream>
#include <string>

#include "platform/error_channel.h"
#include "report/report_command.h"

int main(int argc, char** argv) {
  // Dying of a closed pipe would leave a half-written file behind; as a failed write it passes through the
  // code.
  std::signal(SIGPIPE, SIG_IGN);
  try {
    const int status = vexel_yaml::RunReport({argv + 1, argv + argc});
    // Whoever reads the output must not take a part of it for the whole.
    if (status == 0 && !std::cout.flush()) {
      vexel_yaml::WriteErrorLine("vexel-merge-report: cannot write to standard output");
      return 1;
    }
    return status;
  } catch (const std::exception& error) {
    vexel_yaml::WriteErrorLine(std::string("vexel-merge-report: ") + error.what());
    return 1;
  }
}
