#include "git/page_call.h"

#include <unistd.h>

#include <cstdlib>
#include <iostream>

#include "git/shown_text.h"
#include "platform/display.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

constexpr char kProgram[] = "vexel-merge-view";

}  // namespace

bool CanShowPage() {
  const char* build_server = std::getenv("CI");
  const bool is_alone = build_server != nullptr && *build_server != '\0';
  return !is_alone && HasDisplay() && access((GetDataFilesDir() + kProgram).c_str(), X_OK) == 0;
}

void GoOnOnPage(const std::string& command, const std::vector<std::string>& arguments) {
  const std::string program = GetDataFilesDir() + kProgram;
  std::vector<std::string> call = {kProgram, "--git", command};
  call.insert(call.end(), arguments.begin(), arguments.end());
  std::vector<char*> pointers;
  for (std::string& argument : call) pointers.push_back(argument.data());
  pointers.push_back(nullptr);
  std::cout.flush();
  execv(program.c_str(), pointers.data());
  throw CommandError("cannot run " + program);
}

}  // namespace vexel_yaml
