#include "view/open_browser.h"

#include <fcntl.h>
#include <spawn.h>

#include <csignal>
#include <cstdlib>
#include <sstream>
#include <string_view>
#include <vector>

extern char** environ;

namespace vexel_yaml {

namespace {

std::string Variable(const char* name) {
  const char* value = std::getenv(name);
  return value == nullptr ? std::string() : value;
}

// BROWSER holds commands with colons between them, in which %s stands for the address.
std::vector<std::string> BrowserCommand(const std::string& address) {
  const std::string preferred = Variable("BROWSER");
  std::istringstream words(preferred.substr(0, preferred.find(':')));
  std::vector<std::string> command;
  bool has_address = false;
  for (std::string word; words >> word;) {
    has_address |= word == "%s";
    command.push_back(word == "%s" ? address : word);
  }
#ifdef __APPLE__
  if (command.empty()) command = {"open"};
#else
  if (command.empty()) command = {"xdg-open"};
#endif
  if (!has_address) command.push_back(address);
  return command;
}

}  // namespace

bool OpenBrowser(const std::string& address) {
  std::vector<std::string> command = BrowserCommand(address);
  std::vector<char*> arguments;
  for (std::string& argument : command) arguments.push_back(argument.data());
  arguments.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  // What it says is about itself, and standard output is for the address alone.
  for (const int descriptor : {0, 1, 2}) {
    posix_spawn_file_actions_addopen(&actions, descriptor, "/dev/null", O_RDWR, 0);
  }
  posix_spawnattr_t attributes;
  posix_spawnattr_init(&attributes);
  // Ctrl-C in the terminal is for this program, and not for a browser full of other pages.
  posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETPGROUP | POSIX_SPAWN_SETSIGDEF);
  posix_spawnattr_setpgroup(&attributes, 0);
  // This program ignores it.
  sigset_t broken_pipe;
  sigemptyset(&broken_pipe);
  sigaddset(&broken_pipe, SIGPIPE);
  posix_spawnattr_setsigdefault(&attributes, &broken_pipe);
  pid_t process = 0;
  const int error =
      posix_spawnp(&process, arguments.front(), &actions, &attributes, arguments.data(), environ);
  posix_spawnattr_destroy(&attributes);
  posix_spawn_file_actions_destroy(&actions);
  return error == 0;
}

}  // namespace vexel_yaml
