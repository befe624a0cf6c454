#include "platform/out_of_memory.h"

#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <new>
#include <string_view>

#include "platform/temporary_files.h"

namespace vexel_yaml {

void EndOutOfMemory() noexcept {
  static std::atomic_flag ending = ATOMIC_FLAG_INIT;
  // Another thread ends the process.
  while (ending.test_and_set()) pause();
  UnlinkTempFiles();
  constexpr std::string_view kMessage = "Out of memory\n";
  // With standard error closed, the status has to do.
  [[maybe_unused]] const ssize_t written = write(STDERR_FILENO, kMessage.data(), kMessage.size());
  _exit(1);
}

}  // namespace vexel_yaml

namespace {

void* Allocate(size_t size) {
  // An empty object needs an address of its own.
  void* storage = std::malloc(std::max<size_t>(size, 1));
  if (storage == nullptr) vexel_yaml::EndOutOfMemory();
  return storage;
}

void* AllocateAligned(size_t size, std::align_val_t alignment) {
  void* storage = nullptr;
  if (posix_memalign(&storage, std::max(static_cast<size_t>(alignment), sizeof(void*)), size) != 0) {
    vexel_yaml::EndOutOfMemory();
  }
  return storage;
}

}  // namespace

// All that are called, not only the two that the others stand on: the packaged allocator brings its own.
void* operator new(size_t size) { return Allocate(size); }
void* operator new[](size_t size) { return Allocate(size); }
void* operator new(size_t size, std::align_val_t alignment) { return AllocateAligned(size, alignment); }
void* operator new[](size_t size, std::align_val_t alignment) { return AllocateAligned(size, alignment); }
void* operator new(size_t size, const std::nothrow_t&) noexcept {
  return std::malloc(std::max<size_t>(size, 1));
}
void* operator new[](size_t size, const std::nothrow_t&) noexcept {
  return std::malloc(std::max<size_t>(size, 1));
}
void operator delete(void* storage) noexcept { std::free(storage); }
void operator delete[](void* storage) noexcept { std::free(storage); }
void operator delete(void* storage, size_t) noexcept { std::free(storage); }
void operator delete[](void* storage, size_t) noexcept { std::free(storage); }
void operator delete(void* storage, std::align_val_t) noexcept { std::free(storage); }
void operator delete[](void* storage, std::align_val_t) noexcept { std::free(storage); }
void operator delete(void* storage, size_t, std::align_val_t) noexcept { std::free(storage); }
void operator delete[](void* storage, size_t, std::align_val_t) noexcept { std::free(storage); }
void operator delete(void* storage, const std::nothrow_t&) noexcept { std::free(storage); }
void operator delete[](void* storage, const std::nothrow_t&) noexcept { std::free(storage); }
