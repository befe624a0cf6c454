#pragma once

#include <string>
#include <utility>

namespace vexel_yaml {

/// The exception of the whole library. It stands outside the standard hierarchy on purpose: the commands
/// catch it by its own type and let standard exceptions pass to `main`.
class YAMLError {
 public:
  explicit YAMLError(std::string message) : message_(std::move(message)) {}
  const char* what() const { return message_.c_str(); }

 private:
  std::string message_;
};

}  // namespace vexel_yaml
