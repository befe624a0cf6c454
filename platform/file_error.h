#pragma once

#include <stdexcept>
#include <string>

namespace vexel_yaml {

/// A file could not be read or written; `what()` is "Cannot read '<path>': <the system's reason>" or the same
/// with "write".
class FileError : public std::runtime_error {
 public:
  /// What failed. Opening for writing includes making the file that is to take the place of another.
  enum class Step { kReading, kOpening, kWriting, kClosing };

  /// `error_number` as in errno.
  FileError(Step step, const std::string& path, int error_number);

  Step GetStep() const { return step_; }

 private:
  Step step_;
};

}  // namespace vexel_yaml
