#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <string>
#include <vector>

#include "mapped_file.h"

namespace {

// Asks git for its settings without waiting for the answer.
pid_t AskGit() {
  char command[] = "git";
  char config[] = "config";
  char option[] = "--get-regexp";
  char key[] = "^vexel\\.";
  char* arguments[] = {command, config, option, key, nullptr};
  pid_t process = 0;
  return posix_spawnp(&process, command, nullptr, nullptr, arguments, environ) == 0 ? process : -1;
}

bool WaitForDisk(const std::string& path) {
  const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC);
  const bool is_written = descriptor >= 0 && fsync(descriptor) == 0;
  close(descriptor);
  return is_written;
}

}  // namespace

// What no program that merges three files can do without: least_work [--sync] [--ask-git]... OUT FILE FILE
// FILE
int main(int argc, char** argv) {
  std::vector<std::string> files(argv + 1, argv + argc);
  bool waits_for_disk = false;
  std::vector<pid_t> questions;
  while (!files.empty() && files.front().starts_with("--")) {
    if (files.front() == "--sync") {
      waits_for_disk = true;
    } else {
      questions.push_back(AskGit());
    }
    files.erase(files.begin());
  }
  if (files.size() != 4) return 2;
  std::string text;
  for (size_t i = 1; i < files.size(); ++i) text = MapFile(files[i]);
  for (const pid_t question : questions) {
    if (question < 0 || waitpid(question, nullptr, 0) != question) return 2;
  }
  const std::string work_file = files[0] + ".least-work";
  WriteWholeFile(work_file, text);
  if (waits_for_disk && !WaitForDisk(work_file)) return 2;
  return std::rename(work_file.c_str(), files[0].c_str()) == 0 ? 0 : 2;
}
