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

/// Makes a new folder for its owner alone in the same way, such as for files that other programs read. Once
/// it is empty, it is removed with the files. Returns false on failure, with the reason in errno.
bool CreateTempFolder(std::string& pattern);

/// Makes the folder `path`, which must not exist yet, and remembers it. Returns false on failure, with the
/// reason in errno.
bool MakeTempFolder(const std::string& path);

/// Remembers a file of this name that is about to be made. Returns false where there is no room for it.
bool RememberTempFile(const std::string& path);

/// Forgets a file again that has become one of the user's. May be called from any thread, as the others here.
void ForgetTempFile(const std::string& path);

/// Removes a file or an empty folder that may be remembered. Does nothing for an empty path.
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
