#pragma once

#include <string>
#include <utility>

namespace vexel_yaml {

/// The exception of the whole library. It stands outside the standard hierarchy on purpose: the commands
/// catch it by its own type and let standard exceptions pass to `main`.
class YAMLError {
 public:
  /// `hint`: where it happened or what helps, one line; empty for none. Scripts compare messages as a whole,
  /// so what only people need must not stand in them.
  explicit YAMLError(std::string message, std::string hint = {})
      : message_(std::move(message)), hint_(std::move(hint)) {}
  const char* what() const { return message_.c_str(); }
  const std::string& GetHint() const { return hint_; }

 private:
  std::string message_;
  std::string hint_;
};

}  // namespace vexel_yaml
