#include "platform/file_replacement.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <system_error>
#include <utility>

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

// The link's target, also where that does not exist yet.
std::string FollowLinks(const std::string& path) {
  std::error_code error;
  std::filesystem::path target = path;
  for (int links = 0; std::filesystem::is_symlink(target, error); ++links) {
    // A longer chain is a loop.
    if (links == 40) throw FileError(Step::kOpening, path, ELOOP);
    const std::filesystem::path next = std::filesystem::read_symlink(target, error);
    target = next.is_absolute() ? next : target.parent_path() / next;
  }
  return target.string();
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

FileReplacement::FileReplacement(const std::string& path) : path_(path), target_(path) {
  struct stat status = {};
  const bool exists = stat(path.c_str(), &status) == 0;
  try {
    // Before links are followed: what /dev/stdout leads to may be a pipe, which has no path.
    if (exists && !S_ISREG(status.st_mode)) {
      if (!OpenDestination()) throw FileError(Step::kOpening, path_, errno);
    } else {
      target_ = FollowLinks(path);
      if (exists && access(target_.c_str(), W_OK) != 0) throw FileError(Step::kOpening, path_, errno);
    }
    mode_ = exists ? status.st_mode & 07777 : 0666 & ~process_umask;
    MakeTemporaryFile(exists);
  } catch (...) {
    CloseAll();
    throw;
  }
  stream_.emplace(&buffer_.emplace(temporary_descriptor_));
}

FileReplacement::~FileReplacement() { CloseAll(); }

void FileReplacement::CloseAll() {
  Close(target_descriptor_);
  Close(temporary_descriptor_);
  RemoveTempFile(temporary_);
  temporary_.clear();
}

void FileReplacement::MakeTemporaryFile(bool exists) {
  if (target_descriptor_ < 0) {
    temporary_ = target_.substr(0, target_.rfind('/') + 1) + ".mergeXXXXXX";
    temporary_descriptor_ = OpenTempFile(temporary_);
    if (temporary_descriptor_ >= 0) return;
    temporary_.clear();
    // Any other reason (a full disk, say) must not touch what stands there.
    const bool in_place = errno == EACCES || errno == EPERM || errno == EROFS;
    if (!exists || !in_place) throw FileError(Step::kOpening, path_, errno);
    if (!OpenDestination()) throw FileError(Step::kOpening, path_, errno);
  }
  temporary_ = kTempFilePattern;
  temporary_descriptor_ = OpenTempFile(temporary_);
  if (temporary_descriptor_ >= 0) return;
  temporary_.clear();
  throw FileError(Step::kMakingTemporaryFile, path_, errno);
}

// Nothing is cut off yet.
bool FileReplacement::OpenDestination() {
  target_descriptor_ = open(target_.c_str(), O_WRONLY | O_CLOEXEC);
  return target_descriptor_ >= 0;
}

void FileReplacement::Finish() {
  stream_->flush();
  struct stat status = {};
  int error_number = buffer_->GetErrorNumber();
  if (error_number == 0 && fstat(temporary_descriptor_, &status) != 0) error_number = errno;
  // A stream that has failed without a reason, or a file that is not as long as what was written.
  const bool whole = *stream_ && static_cast<uint64_t>(status.st_size) == buffer_->GetCount();
  if (error_number == 0 && !whole) error_number = EIO;
  // What is copied later is flushed where it comes to stand.
  if (error_number == 0 && target_descriptor_ < 0) {
    const bool changed = fchmod(temporary_descriptor_, mode_) == 0;
    error_number = changed ? FlushToDisk(temporary_descriptor_) : errno;
  }
  if (error_number != 0) throw FileError(Step::kWriting, path_, error_number);
  error_number = Close(temporary_descriptor_);
  if (error_number != 0) throw FileError(Step::kClosing, path_, error_number);
}

void FileReplacement::Commit() {
  if (temporary_descriptor_ >= 0) Finish();
  if (target_descriptor_ < 0) {
    if (std::rename(temporary_.c_str(), target_.c_str()) == 0) {
      ForgetTempFile(std::exchange(temporary_, {}));
      return;
    }
    // Somebody else's file in a shared folder, or a mount point, may be written but not replaced.
    if (errno != EPERM && errno != EACCES && errno != EBUSY) throw FileError(Step::kWriting, path_, errno);
    const int error_number = errno;
    if (!OpenDestination()) throw FileError(Step::kWriting, path_, error_number);
  }
  CopyIntoPlace();
}

void FileReplacement::CopyIntoPlace() {
  const std::optional<std::string> text = ReadWholeFile(temporary_);
  if (!text || text->size() != buffer_->GetCount()) {
    throw FileError(Step::kWriting, path_, text ? EIO : errno);
  }
  const bool regular = IsRegular(target_descriptor_);
  int error_number = regular ? ReserveRoom(target_descriptor_, text->size()) : 0;
  if (error_number != 0) throw FileError(Step::kWriting, path_, error_number);
  DescriptorBuffer copy(target_descriptor_);
  copy.sputn(text->data(), static_cast<std::streamsize>(text->size()));
  copy.pubsync();
  error_number = copy.GetErrorNumber();
  if (error_number == 0 && regular) {
    const bool cut = ftruncate(target_descriptor_, static_cast<off_t>(text->size())) == 0;
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
