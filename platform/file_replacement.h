#pragma once

#include <fstream>
#include <stdexcept>
#include <string>

namespace vexel_yaml {

/// A file could not be written; `what()` is "Cannot write '<path>': <the system's reason>".
class FileError : public std::runtime_error {
 public:
  FileError(const std::string& path, int error_number);
};

/// Writes a file that is replaced whole or not at all.
///
/// The text goes to a new file beside the destination, which takes the destination's place (and its
/// permission bits) on `Commit`. A symbolic link is followed to its target. What is not a regular file (a
/// device, a pipe) is written in place, and so is a file that can't be replaced or whose folder is not
/// writable. Without a `Commit` the destination stays as it was, except where it is written in place.
class FileReplacement {
 public:
  /// Throws FileError when nothing can be opened for writing.
  explicit FileReplacement(const std::string& path);
  FileReplacement(const FileReplacement&) = delete;
  FileReplacement& operator=(const FileReplacement&) = delete;
  ~FileReplacement();

  std::ostream& Stream() { return stream_; }

  /// Ends the writing. Throws FileError when anything could not be written.
  void Commit();

 private:
  void OpenInPlace();
  void Close();
  void RemoveBeside();

  std::string path_;
  std::string target_;
  std::string beside_;
  std::ofstream stream_;
};

/// Replaces the file `destination` by a copy of the content of `source`. Throws FileError.
void CopyFileContent(const std::string& source, const std::string& destination);

}  // namespace vexel_yaml
