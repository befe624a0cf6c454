#include "platform/file_replacement.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <charconv>
#include <cstdio>
#include <filesystem>
#include <system_error>
#include <utility>

#include "platform/ending_signals.h"
#include "platform/read_whole_file.h"
#include "platform/temporary_files.h"

namespace vexel_yaml {

namespace {

using Step = FileError::Step;

// The only way to learn it is to set it, which must not happen while another thread makes a file.
const mode_t process_umask = [] {
  const mode_t mask = umask(077);
  umask(mask);
  return mask;
}();

// Whether `path` stands in the folder of a process's open files, or in one that is like it: what looks like a
// link there leads to an open file, whose name may be gone or be another file's by now.
bool LeadsToOpenFile(const std::filesystem::path& path) {
  std::error_code error;
  const std::string folder = std::filesystem::canonical(path.parent_path(), error).string();
  return folder.starts_with("/proc/") || folder == "/dev/fd";
}

// The descriptor of this process that `path` stands for ("/dev/fd/7"), else -1.
int OwnDescriptor(const std::filesystem::path& path) {
  std::error_code error;
  const std::filesystem::path folder = std::filesystem::canonical(path.parent_path(), error);
  if (folder.empty() || (folder != std::filesystem::canonical("/proc/self/fd", error) &&
                         folder != std::filesystem::canonical("/dev/fd", error))) {
    return -1;
  }
  const std::string name = path.filename().string();
  int descriptor = -1;
  const auto [end, failure] = std::from_chars(name.data(), name.data() + name.size(), descriptor);
  return failure == std::errc() && end == name.data() + name.size() ? descriptor : -1;
}

// On a file system without permissions a new file gets what every file has there.
bool ChangeMode(int descriptor, mode_t mode) {
  return fchmod(descriptor, mode) == 0 || errno == EPERM || errno == EINVAL || errno == ENOTSUP ||
         errno == ENOSYS;
}

bool IsRegular(int descriptor) {
  struct stat status = {};
  return fstat(descriptor, &status) == 0 && S_ISREG(status.st_mode);
}

// Brings a file's content to the disk. Some file systems can't, and say so.
int FlushToDisk(int descriptor) {
  while (fsync(descriptor) != 0) {
    if (errno == EINVAL || errno == ENOTSUP || errno == ENOSYS) return 0;
    if (errno != EINTR) return errno;
  }
  return 0;
}

// The number is invalid afterwards, whatever happened. Returns an errno.
int Close(int& descriptor) {
  const int closed = std::exchange(descriptor, -1);
  // Interrupted, it is closed all the same.
  return closed >= 0 && close(closed) != 0 && errno != EINTR ? errno : 0;
}

// Overwriting needs no new room up to the old size; beyond it a full disk must be noticed before a byte of
// the old content is gone. The size stays, so that whoever looks meanwhile sees the old file.
int ReserveRoom([[maybe_unused]] int descriptor, [[maybe_unused]] size_t size) {
#ifdef __linux__
  struct stat status = {};
  if (fstat(descriptor, &status) != 0) return errno;
  if (size == 0 || fallocate(descriptor, FALLOC_FL_KEEP_SIZE, 0, static_cast<off_t>(size)) == 0) return 0;
  const int error_number = errno;
  if (error_number == EOPNOTSUPP || error_number == ENOSYS) return 0;
  // Gives back what room was found.
  return ftruncate(descriptor, status.st_size) == 0 ? error_number : errno;
#else
  return 0;
#endif
}

}  // namespace

std::string FollowLinks(const std::string& path) {
  std::error_code error;
  std::filesystem::path target = path;
  for (int links = 0; std::filesystem::is_symlink(target, error) && !LeadsToOpenFile(target); ++links) {
    // A longer chain is a loop.
    if (links == 40) throw FileError(Step::kOpening, path, ELOOP);
    const std::filesystem::path next = std::filesystem::read_symlink(target, error);
    target = next.is_absolute() ? next : target.parent_path() / next;
  }
  return target.string();
}

FileReplacement::FileReplacement(const std::string& path) : path_(path), target_(FollowLinks(path)) {
  struct stat status = {};
  const bool exists = stat(path.c_str(), &status) == 0;
  // Who may run a program as somebody else must not give that away with a new file.
  mode_ = exists ? status.st_mode & 0777 : 0666 & ~process_umask;
  own_descriptor_ = OwnDescriptor(target_);
  const bool in_place = own_descriptor_ >= 0 || LeadsToOpenFile(target_) || !S_ISREG(status.st_mode);
  try {
    if (exists && in_place) {
      if (!OpenDestination()) throw FileError(Step::kOpening, path_, errno);
    } else {
      if (exists && access(target_.c_str(), W_OK) != 0) throw FileError(Step::kOpening, path_, errno);
      MakeTemporaryFile(exists);
    }
  } catch (...) {
    CloseAll();
    throw;
  }
  stream_.emplace(buffer_ ? static_cast<std::streambuf*>(&*buffer_) : &text_);
}

FileReplacement::~FileReplacement() { CloseAll(); }

void FileReplacement::CloseAll() {
  Close(target_descriptor_);
  Close(temporary_descriptor_);
  RemoveTempFile(temporary_);
  temporary_.clear();
}

void FileReplacement::MakeTemporaryFile(bool exists) {
  temporary_ = target_.substr(0, target_.rfind('/') + 1) + ".mergeXXXXXX";
  temporary_descriptor_ = OpenTempFile(temporary_);
  if (temporary_descriptor_ >= 0) {
    buffer_.emplace(temporary_descriptor_);
    return;
  }
  temporary_.clear();
  const int error_number = errno;
  // Any other reason (a full disk, say) must not touch what stands there.
  const bool in_place = error_number == EACCES || error_number == EPERM || error_number == EROFS;
  if (exists && in_place) {
    if (!OpenDestination()) throw FileError(Step::kOpening, path_, errno);
    return;
  }
  // What exists could have been opened: it is the text that found no room.
  throw FileError(exists ? Step::kWriting : Step::kOpening, path_, error_number);
}

// Nothing is cut off yet.
bool FileReplacement::OpenDestination() {
  if (own_descriptor_ < 0) {
    target_descriptor_ = open(target_.c_str(), O_WRONLY | O_CLOEXEC);
  } else if ((fcntl(own_descriptor_, F_GETFL) & O_ACCMODE) == O_RDONLY) {
    errno = EBADF;
  } else {
    // Opened anew, it would be written from its beginning, over what the caller has written.
    target_descriptor_ = fcntl(own_descriptor_, F_DUPFD_CLOEXEC, 0);
  }
  return target_descriptor_ >= 0;
}

void FileReplacement::Finish() {
  stream_->flush();
  if (temporary_descriptor_ < 0) {
    // The text waits in memory, or was finished before.
    if (!*stream_) throw FileError(Step::kWriting, path_, EIO);
    return;
  }
  struct stat status = {};
  int error_number = buffer_->GetErrorNumber();
  if (error_number == 0 && fstat(temporary_descriptor_, &status) != 0) error_number = errno;
  // A stream that has failed without a reason, or a file that is not as long as what was written.
  const bool whole = *stream_ && static_cast<uint64_t>(status.st_size) == buffer_->GetCount();
  if (error_number == 0 && !whole) error_number = EIO;
  if (error_number == 0) {
    error_number = ChangeMode(temporary_descriptor_, mode_) ? FlushToDisk(temporary_descriptor_) : errno;
  }
  if (error_number != 0) throw FileError(Step::kWriting, path_, error_number);
  error_number = Close(temporary_descriptor_);
  if (error_number != 0) throw FileError(Step::kClosing, path_, error_number);
}

void FileReplacement::Commit() {
  Finish();
  if (target_descriptor_ >= 0) return WriteInPlace(text_.view());
  if (std::rename(temporary_.c_str(), target_.c_str()) == 0) {
    ForgetTempFile(std::exchange(temporary_, {}));
    return;
  }
  // Somebody else's file in a shared folder, or a mount point, may be written but not replaced.
  if (errno != EPERM && errno != EACCES && errno != EBUSY) throw FileError(Step::kWriting, path_, errno);
  const int error_number = errno;
  if (!OpenDestination()) throw FileError(Step::kWriting, path_, error_number);
  const std::optional<std::string> text = ReadWholeFile(temporary_);
  if (!text || text->size() != buffer_->GetCount()) {
    throw FileError(Step::kWriting, path_, text ? EIO : errno);
  }
  WriteInPlace(*text);
}

void FileReplacement::WriteInPlace(std::string_view text) {
  const bool regular = IsRegular(target_descriptor_);
  // Ended in the middle, it would be half the old and half the new file. A pipe may wait for its reader
  // for ever, and nobody could end that.
  std::optional<SignalsHeld> held;
  if (regular) held.emplace();
  // What the caller has opened goes on behind the text.
  const bool replaced = regular && own_descriptor_ < 0;
  int error_number = replaced ? ReserveRoom(target_descriptor_, text.size()) : 0;
  if (error_number != 0) throw FileError(Step::kWriting, path_, error_number);
  DescriptorBuffer copy(target_descriptor_);
  copy.sputn(text.data(), static_cast<std::streamsize>(text.size()));
  copy.pubsync();
  error_number = copy.GetErrorNumber();
  if (error_number == 0 && replaced) {
    const bool cut = ftruncate(target_descriptor_, static_cast<off_t>(text.size())) == 0;
    error_number = cut ? FlushToDisk(target_descriptor_) : errno;
  }
  if (error_number != 0) throw FileError(Step::kWriting, path_, error_number);
  error_number = Close(target_descriptor_);
  if (error_number != 0) throw FileError(Step::kClosing, path_, error_number);
}

void ReplaceFile(const std::string& path, std::string_view text) {
  FileReplacement file(path);
  file.Stream() << text;
  file.Commit();
}

}  // namespace vexel_yaml
