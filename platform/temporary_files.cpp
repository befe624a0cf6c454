#include "platform/temporary_files.h"

#include <unistd.h>

#include <array>
#include <atomic>
#include <csignal>
#include <cstdlib>
#include <cstring>

namespace vexel_yaml {

namespace {

constexpr char kTemplate[] = "/tmp/MERGEXXXXXX";

// Fixed storage, so that a signal handler can walk it: a person who interrupts a merge in a hurry would
// otherwise leave copies of the scene in the temporary folder. A merge makes at most four files.
constexpr size_t kCapacity = 8;
std::array<std::array<char, sizeof(kTemplate)>, kCapacity> paths;
std::atomic<size_t> path_count = 0;

extern "C" void RemoveTempFilesAndDie(int signal_number) {
  RemoveTempFiles();
  std::signal(signal_number, SIG_DFL);
  raise(signal_number);
}

void HandleSignal(int signal_number) {
  // A signal that the caller has switched off (nohup) stays off.
  if (std::signal(signal_number, RemoveTempFilesAndDie) == SIG_IGN) std::signal(signal_number, SIG_IGN);
}

}  // namespace

std::string CreateTempFile() {
  if (path_count == kCapacity) return {};
  char path[sizeof(kTemplate)];
  std::memcpy(path, kTemplate, sizeof(path));
  const int file = mkstemp(path);
  if (file < 0) return {};
  close(file);
  std::memcpy(paths[path_count].data(), path, sizeof(path));
  if (path_count++ == 0) {
    for (const int signal_number : {SIGHUP, SIGINT, SIGTERM}) HandleSignal(signal_number);
  }
  return path;
}

void RemoveTempFiles() {
  for (size_t i = path_count.exchange(0); i > 0; --i) unlink(paths[i - 1].data());
}

}  // namespace vexel_yaml
