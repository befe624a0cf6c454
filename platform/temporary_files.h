#pragma once

#include <string>

namespace vexel_yaml {

/// Remembers a file that must not outlive the process: `RemoveTempFiles` removes it, and so does a signal
/// that ends the process. Returns false where it can't: beyond a handful of files at once, and for a path
/// that is too long. May be called from any thread, as the other functions here.
bool RememberTempFile(const std::string& path);

/// Forgets it again: it has been removed or has become a file of the user's.
void ForgetTempFile(const std::string& path);

/// Makes a new, empty file in /tmp that only its owner may read (the name starts with "MERGE") and remembers
/// it. Returns its path, empty on failure.
std::string CreateTempFile();

/// Removes every file that is still remembered.
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
