#pragma once

#include <stdexcept>
#include <string>
#include <utility>

namespace vexel_yaml {

/// A standard exception that also says where it happened: its text is compared by scripts as a whole, so a
/// person gets the place as a hint behind it.
class HintedError : public std::runtime_error {
 public:
  HintedError(const std::string& message, std::string hint)
      : std::runtime_error(message), hint_(std::move(hint)) {}
  const std::string& GetHint() const { return hint_; }

 private:
  std::string hint_;
};

}  // namespace vexel_yaml
