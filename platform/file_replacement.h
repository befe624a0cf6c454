#pragma once

#include <sys/types.h>

#include <optional>
#include <ostream>
#include <sstream>
#include <string>
#include <string_view>

#include "platform/descriptor_buffer.h"
#include "platform/file_error.h"

namespace vexel_yaml {

/// What a chain of symbolic links leads to, also where that does not exist yet; other paths as they are.
/// Throws FileError for a loop.
std::string FollowLinks(const std::string& path);

/// Writes a file that is replaced whole or not at all.
///
/// The text goes to a new file beside the destination, which takes the destination's place (and its
/// permission bits, as far as the file system knows any) on `Commit`. A symbolic link is followed to its
/// target. What is not a regular file (a device, a pipe) and a file that can't be replaced or whose folder is
/// not writable are written in place instead, on `Commit`, too. So is what the process has open already
/// ("/dev/stdout", "/dev/fd/7"), from where the last writer ended. Without a `Commit` the destination stays
/// as it was.
///
/// A temporary file and a renaming beat writing in place: a disk that fills up, a crash or a signal in the
/// middle would leave half a scene, and version control would take it for the result. Until all of the text
/// is on the disk the old file is the only whole one, so the new one is flushed there before the renaming.
class FileReplacement {
 public:
  /// Throws FileError: where nothing can be opened for writing, as a failed opening, and where what exists
  /// can be opened, but there is no room beside it, as a failed writing. To be called by one thread at a
  /// time, so that a signal between making a file and remembering it leaves none behind.
  explicit FileReplacement(const std::string& path);
  FileReplacement(const FileReplacement&) = delete;
  FileReplacement& operator=(const FileReplacement&) = delete;
  ~FileReplacement();

  std::ostream& Stream() { return *stream_; }

  /// Whether `Commit` writes it in place, which can still fail for want of room.
  bool IsInPlace() const { return target_descriptor_ >= 0; }

  /// Ends the writing and brings the text to the disk, while the destination stays as it was: the step that
  /// fails on a full disk. Throws FileError.
  void Finish();

  /// Puts the text in the destination's place, after `Finish` if that was not called. Throws FileError.
  void Commit();

 private:
  void MakeTemporaryFile(bool exists);
  bool OpenDestination();
  void WriteInPlace(std::string_view text);
  void CloseAll();

  std::string path_;
  std::string target_;
  mode_t mode_ = 0;
  // What the path stands for, what is written first, and what is written in place; -1 for none.
  int own_descriptor_ = -1;
  std::string temporary_;
  int temporary_descriptor_ = -1;
  int target_descriptor_ = -1;
  std::optional<DescriptorBuffer> buffer_;
  // The text of what is written in place.
  std::stringbuf text_;
  std::optional<std::ostream> stream_;
};

/// Replaces the file `path` by one that holds `text`. Throws FileError.
void ReplaceFile(const std::string& path, std::string_view text);

}  // namespace vexel_yaml
