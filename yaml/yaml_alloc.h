#pragma once

#include <algorithm>
#include <array>
#include <atomic>
#include <cstddef>
#include <memory>
#include <new>
#include <utility>
#include <vector>

#include "platform/mutex.h"

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define VEXEL_POISONS_FREED_STORAGE
#endif
#elif defined(__SANITIZE_ADDRESS__)
#define VEXEL_POISONS_FREED_STORAGE
#endif
#ifdef VEXEL_POISONS_FREED_STORAGE
#include <sanitizer/asan_interface.h>
#define VEXEL_POISON(address, size) ASAN_POISON_MEMORY_REGION(address, size)
#define VEXEL_UNPOISON(address, size) ASAN_UNPOISON_MEMORY_REGION(address, size)
#else
#define VEXEL_POISON(address, size) static_cast<void>(0)
#define VEXEL_UNPOISON(address, size) static_cast<void>(0)
#endif

namespace vexel_yaml {

/// The recycling pool of one type.
///
/// Storage is cut from blocks that live until the process ends, so a tree that nobody needs any more may
/// simply be abandoned. At most `kMostSpares` given-back objects are kept ready (emptied by their
/// `ResetForAlloc`); beyond that an object is destroyed and its storage waits to be cut again.
template <typename T>
class YAMLAlloc {
 public:
  static constexpr size_t kMostSpares = 301;

  /// Takes storage from the pool and constructs a T in it from `args`. Throws std::bad_alloc, and what the
  /// constructor throws; the storage is then back in the pool.
  template <typename... Args>
  static T* create(Args&&... args) {
    Count(count);
    void* storage = allocate();
    try {
      return new (storage) T(std::forward<Args>(args)...);
    } catch (...) {
      AutoLock lock(s_Mutex);
      LeaveVacant(storage);
      throw;
    }
  }

  /// Raw storage for one T: the spare given back last, else storage of a destroyed object, else fresh.
  static void* allocate() {
    if (s_Returned.load(std::memory_order_relaxed) != 0) {
      AutoLock lock(s_Mutex);
      if (void* storage = TakeReturned()) return storage;
    }
    thread_local Block block;
    if (block.next == kBlockLength) {
      block.storage = NewBlock();
      block.next = 0;
    }
    return &block.storage[block.next++];
  }

  /// Gives an object back; null is ignored. Never throws and takes no memory: destructors call it, also while
  /// an exception looks for its handler.
  static void free(T* object) noexcept {
    if (object == nullptr) return;
    Count(freed);
    // Outside the lock: emptying a tree gives its children back, to this pool and to others.
    object->ResetForAlloc();
    AutoLock lock(s_Mutex);
    if (s_SpareCount < kMostSpares) {
      // Spares stay open: what their members still own must be seen by a leak check.
      s_Spares[s_SpareCount++] = object;
      s_Returned.fetch_add(1, std::memory_order_relaxed);
    } else {
      std::destroy_at(object);
      LeaveVacant(object);
    }
  }

  /// Statistics. Threads may lose one another's increments.
  static inline std::atomic<size_t> count = 0;
  static inline std::atomic<size_t> reused = 0;
  static inline std::atomic<size_t> freed = 0;

 private:
  static constexpr size_t kBlockLength = 128;

  // Storage that nothing lives in, linked through its own bytes.
  struct Vacancy {
    Vacancy* next;
  };
  static constexpr size_t kSlotSize = std::max(sizeof(T), sizeof(Vacancy));

  struct alignas(T) alignas(Vacancy) Slot {
    std::byte bytes[kSlotSize];
  };

  // A thread's own piece of fresh storage, cut without a lock.
  struct Block {
    Slot* storage = nullptr;
    size_t next = kBlockLength;
  };

  static void Count(std::atomic<size_t>& counter) {
    counter.store(counter.load(std::memory_order_relaxed) + 1, std::memory_order_relaxed);
  }

  static void LeaveVacant(void* storage) {
    s_Vacant = new (storage) Vacancy{s_Vacant};
    s_Returned.fetch_add(1, std::memory_order_relaxed);
    VEXEL_POISON(storage, kSlotSize);
  }

  static void* TakeReturned() {
    if (s_SpareCount != 0) {
      T* spare = s_Spares[--s_SpareCount];
      std::destroy_at(spare);
      Count(reused);
      s_Returned.fetch_sub(1, std::memory_order_relaxed);
      return spare;
    }
    if (s_Vacant == nullptr) return nullptr;
    void* storage = s_Vacant;
    VEXEL_UNPOISON(storage, kSlotSize);
    s_Vacant = s_Vacant->next;
    s_Returned.fetch_sub(1, std::memory_order_relaxed);
    return storage;
  }

  static Slot* NewBlock() {
    auto block = std::make_unique_for_overwrite<Slot[]>(kBlockLength);
    AutoLock lock(s_Mutex);
    s_Blocks.push_back(std::move(block));
    return s_Blocks.back().get();
  }

  static inline Mutex s_Mutex;
  // Never destroyed: what still lives in the blocks at the end of the process is abandoned with them.
  static inline std::vector<std::unique_ptr<Slot[]>>& s_Blocks = *new std::vector<std::unique_ptr<Slot[]>>;
  static inline std::array<T*, kMostSpares> s_Spares = {};
  static inline size_t s_SpareCount = 0;
  static inline Vacancy* s_Vacant = nullptr;
  static inline std::atomic<size_t> s_Returned = 0;
};

}  // namespace vexel_yaml
