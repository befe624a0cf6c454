#pragma once

#include <atomic>
#include <cstddef>
#include <memory>
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

  /// Takes storage from the pool and constructs a T in it from `args`.
  template <typename... Args>
  static T* create(Args&&... args) {
    Count(count);
    return new (allocate()) T(std::forward<Args>(args)...);
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

  /// Gives an object back; null is ignored.
  static void free(T* object) {
    if (object == nullptr) return;
    Count(freed);
    size_t spares = 0;
    {
      AutoLock lock(s_Mutex);
      spares = s_FreeList.size();
    }
    const bool keep = spares < kMostSpares;
    // Outside the lock: emptying a tree gives its children back, to this pool and to others.
    if (keep) {
      object->ResetForAlloc();
    } else {
      std::destroy_at(object);
    }
    AutoLock lock(s_Mutex);
    (keep ? s_FreeList : s_Vacant).push_back(object);
    s_Returned.fetch_add(1, std::memory_order_relaxed);
    // Spares stay open: what their members still own must be seen by a leak check.
    if (!keep) VEXEL_POISON(object, sizeof(T));
  }

  /// Statistics. Threads may lose one another's increments.
  static inline std::atomic<size_t> count = 0;
  static inline std::atomic<size_t> reused = 0;
  static inline std::atomic<size_t> freed = 0;

 private:
  static constexpr size_t kBlockLength = 128;

  struct alignas(T) Slot {
    std::byte bytes[sizeof(T)];
  };

  // A thread's own piece of fresh storage, cut without a lock.
  struct Block {
    Slot* storage = nullptr;
    size_t next = kBlockLength;
  };

  static void Count(std::atomic<size_t>& counter) {
    counter.store(counter.load(std::memory_order_relaxed) + 1, std::memory_order_relaxed);
  }

  static void* TakeReturned() {
    if (!s_FreeList.empty()) {
      T* spare = s_FreeList.back();
      s_FreeList.pop_back();
      std::destroy_at(spare);
      Count(reused);
      s_Returned.fetch_sub(1, std::memory_order_relaxed);
      return spare;
    }
    if (s_Vacant.empty()) return nullptr;
    T* storage = s_Vacant.back();
    s_Vacant.pop_back();
    VEXEL_UNPOISON(storage, sizeof(T));
    s_Returned.fetch_sub(1, std::memory_order_relaxed);
    return storage;
  }

  static Slot* NewBlock() {
    AutoLock lock(s_Mutex);
    s_Blocks.push_back(std::make_unique_for_overwrite<Slot[]>(kBlockLength));
    return s_Blocks.back().get();
  }

  static inline Mutex s_Mutex;
  // Never destroyed: what still lives in the blocks at the end of the process is abandoned with them.
  static inline std::vector<std::unique_ptr<Slot[]>>& s_Blocks = *new std::vector<std::unique_ptr<Slot[]>>;
  static inline std::vector<T*>& s_FreeList = *new std::vector<T*>;
  static inline std::vector<T*>& s_Vacant = *new std::vector<T*>;
  static inline std::atomic<size_t> s_Returned = 0;
};

}  // namespace vexel_yaml
