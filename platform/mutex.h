#pragma once

#include <mutex>

namespace vexel_yaml {

/// A lock that its holder may take again, so that code under a pool's lock may still use the pool.
using Mutex = std::recursive_mutex;

/// Holds a `Mutex` for its own lifetime.
using AutoLock = std::lock_guard<Mutex>;

}  // namespace vexel_yaml
