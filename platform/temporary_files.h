#pragma once

#include <string>

namespace vexel_yaml {

/// Makes a new, empty file in /tmp that only its owner may read (the name starts with "MERGE") and
/// remembers it for `RemoveTempFiles`. Returns its path, empty on failure.
std::string CreateTempFile();

/// Removes every file that `CreateTempFile` has made and that is still remembered.
void RemoveTempFiles();

/// Calls `RemoveTempFiles` at the end of its scope, also when an exception passes.
class TempFilesGuard {
 public:
  TempFilesGuard() = default;
  TempFilesGuard(const TempFilesGuard&) = delete;
  TempFilesGuard& operator=(const TempFilesGuard&) = delete;
  ~TempFilesGuard() { RemoveTempFiles(); }
};

}  // namespace vexel_yaml
