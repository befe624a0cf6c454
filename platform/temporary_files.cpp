#include "platform/temporary_files.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <cstdlib>
#include <utility>

#include "platform/ending_signals.h"
#include "platform/mutex.h"

namespace vexel_yaml {

namespace {

// Fixed storage, so that a signal handler can walk it: a person who interrupts a merge in a hurry would
// otherwise leave copies of the scene in the temporary folder or, worse, in the working copy. A merge has at
// most four temporary files and four that wait to take the place of others; for a page with many scenes,
// slots are added, and never given back.
struct Slot {
  std::array<char, 4096> path;
  std::atomic<bool> used = false;
  Slot* next = nullptr;
};

std::array<Slot, 16> slots;
std::atomic<Slot*> added_slots = nullptr;
Mutex slots_mutex;

template <typename Action>
void ForEachSlot(Action action) {
  for (Slot& slot : slots) action(slot);
  for (Slot* slot = added_slots; slot != nullptr; slot = slot->next) action(*slot);
}

Slot* FreeSlot() {
  Slot* free = nullptr;
  ForEachSlot([&](Slot& slot) {
    if (!slot.used) free = &slot;
  });
  if (free != nullptr) return free;
  auto* added = new Slot;
  added->next = added_slots;
  added_slots = added;
  return added;
}

// Returns 0 or an errno.
int Remember(const std::string& path) {
  AutoLock lock(slots_mutex);
  HandleEndingSignals();
  Slot* slot = FreeSlot();
  if (path.size() >= slot->path.size()) return ENAMETOOLONG;
  *std::copy(path.begin(), path.end(), slot->path.begin()) = '\0';
  slot->used = true;
  return 0;
}

}  // namespace

int OpenTempFile(std::string& pattern) {
  // A signal now would find a file that is not remembered yet.
  const SignalsHeld held;
  const int file = mkstemp(pattern.data());
  if (file < 0) return -1;
  // A merge tool that runs meanwhile has no business with it.
  fcntl(file, F_SETFD, FD_CLOEXEC);
  const int error_number = Remember(pattern);
  if (error_number == 0) return file;
  close(file);
  unlink(pattern.c_str());
  errno = error_number;
  return -1;
}

std::string CreateTempFile() {
  std::string path = kTempFilePattern;
  const int file = OpenTempFile(path);
  if (file < 0) return {};
  close(file);
  return path;
}

bool MakeTempFolder(const std::string& path) {
  const SignalsHeld held;
  if (mkdir(path.c_str(), 0777) != 0) return false;
  errno = Remember(path);
  if (errno == 0) return true;
  rmdir(path.c_str());
  return false;
}

bool CreateTempFolder(std::string& pattern) {
  const SignalsHeld held;
  if (mkdtemp(pattern.data()) == nullptr) return false;
  errno = Remember(pattern);
  if (errno == 0) return true;
  rmdir(pattern.c_str());
  return false;
}

bool RememberTempFile(const std::string& path) { return Remember(path) == 0; }

void ForgetTempFile(const std::string& path) {
  AutoLock lock(slots_mutex);
  ForEachSlot([&](Slot& slot) {
    if (slot.used && path == slot.path.data()) slot.used = false;
  });
}

void RemoveTempFile(const std::string& path) {
  if (path.empty()) return;
  if (unlink(path.c_str()) != 0) rmdir(path.c_str());
  ForgetTempFile(path);
}

void RemoveTempFiles() {
  AutoLock lock(slots_mutex);
  UnlinkTempFiles();
  ForEachSlot([](Slot& slot) { slot.used = false; });
}

void UnlinkTempFiles() {
  ForEachSlot([](const Slot& slot) {
    if (slot.used) unlink(slot.path.data());
  });
  // Folders, which are empty by now.
  ForEachSlot([](const Slot& slot) {
    if (slot.used) rmdir(slot.path.data());
  });
}

}  // namespace vexel_yaml
