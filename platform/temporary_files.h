#pragma once

#include <string>

namespace vexel_yaml {

/// Where temporary files stand that are not to take another one's place.
inline constexpr char kTempFilePattern[] = "/tmp/MERGEXXXXXX";

/// Makes a new, empty file that only its owner may read and remembers it: it must not outlive the process, so
/// `RemoveTempFiles` removes it, and so does a signal that ends the process. `pattern` ends in "XXXXXX",
/// which becomes a name that was free and that nobody can foresee. Returns a descriptor open for reading and
/// writing, or -1 with the reason in errno, also beyond a handful of files at once.
int OpenTempFile(std::string& pattern);

/// Makes a file after `kTempFilePattern` in the same way. Returns its path, empty on failure; errno says why.
std::string CreateTempFile();

/// Forgets a file again that has become one of the user's. May be called from any thread, as the others here
/// but `OpenTempFile`: with a signal on another thread, the file it is just making would stay.
void ForgetTempFile(const std::string& path);

/// Removes a file that may be remembered. Does nothing for an empty path.
void RemoveTempFile(const std::string& path);

/// Removes every file that is still remembered.
void RemoveTempFiles();

/// The same for those who may neither wait nor allocate, and end the process afterwards.
void UnlinkTempFiles();

/// Calls `RemoveTempFiles` at the end of its scope, also when an exception passes.
class TempFilesGuard {
 public:
  TempFilesGuard() = default;
  TempFilesGuard(const TempFilesGuard&) = delete;
  TempFilesGuard& operator=(const TempFilesGuard&) = delete;
  ~TempFilesGuard() { RemoveTempFiles(); }
};

}  // namespace vexel_yaml
