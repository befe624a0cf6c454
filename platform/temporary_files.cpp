#include "platform/temporary_files.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <csignal>
#include <cstdlib>

#include "platform/mutex.h"

namespace vexel_yaml {

namespace {

// Fixed storage, so that a signal handler can walk it: a person who interrupts a merge in a hurry would
// otherwise leave copies of the scene in the temporary folder or, worse, in the working copy. A merge has at
// most four temporary files and two that wait to take the place of others.
struct Slot {
  std::array<char, 4096> path;
  std::atomic<bool> used = false;
};

std::array<Slot, 16> slots;
Mutex slots_mutex;

extern "C" void RemoveTempFilesAndDie(int signal_number) {
  for (Slot& slot : slots) {
    if (slot.used) unlink(slot.path.data());
  }
  std::signal(signal_number, SIG_DFL);
  raise(signal_number);
}

void HandleSignals() {
  for (const int signal_number : {SIGHUP, SIGINT, SIGTERM}) {
    // A signal that the caller has switched off (nohup) stays off.
    if (std::signal(signal_number, RemoveTempFilesAndDie) == SIG_IGN) std::signal(signal_number, SIG_IGN);
  }
}

}  // namespace

bool RememberTempFile(const std::string& path) {
  AutoLock lock(slots_mutex);
  static const bool handled = (HandleSignals(), true);
  Slot* slot = std::find_if(slots.begin(), slots.end(), [](const Slot& s) { return !s.used; });
  if (!handled || slot == slots.end() || path.size() >= slot->path.size()) return false;
  *std::copy(path.begin(), path.end(), slot->path.begin()) = '\0';
  slot->used = true;
  return true;
}

void ForgetTempFile(const std::string& path) {
  AutoLock lock(slots_mutex);
  for (Slot& slot : slots) {
    if (slot.used && path == slot.path.data()) slot.used = false;
  }
}

std::string CreateTempFile() {
  std::string path = "/tmp/MERGEXXXXXX";
  const int file = mkstemp(path.data());
  if (file < 0) return {};
  close(file);
  if (RememberTempFile(path)) return path;
  unlink(path.c_str());
  return {};
}

void RemoveTempFiles() {
  AutoLock lock(slots_mutex);
  for (Slot& slot : slots) {
    if (slot.used) unlink(slot.path.data());
    slot.used = false;
  }
}

}  // namespace vexel_yaml
