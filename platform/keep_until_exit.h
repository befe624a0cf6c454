#pragma once

#include <memory>
#include <utility>
#include <vector>

namespace vexel_yaml {

/// Returns the object, which lives until the process ends: giving back the nodes of three scenes one by one
/// would take as long as merging them. One thread at a time.
template <class T>
T& KeepUntilExit(std::unique_ptr<T> object) {
  // Something must lead to it, or it counts as lost where leaks are looked for.
  static auto& kept = *new std::vector<std::unique_ptr<T>>;
  return *kept.emplace_back(std::move(object));
}

}  // namespace vexel_yaml
