#include "platform/file_replacement.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <system_error>

#include "platform/temporary_files.h"

namespace vexel_yaml {

namespace {

// The link's target, also where that does not exist yet.
std::string FollowLinks(const std::string& path) {
  std::error_code error;
  std::filesystem::path target = path;
  for (int links = 0; std::filesystem::is_symlink(target, error); ++links) {
    // A longer chain is a loop.
    if (links == 40) throw FileError(path, ELOOP);
    const std::filesystem::path next = std::filesystem::read_symlink(target, error);
    target = next.is_absolute() ? next : target.parent_path() / next;
  }
  return target.string();
}

// A new file in the folder of `target` with the permissions that the umask gives. Where there can be none,
// the result is empty and errno says why.
std::string CreateBeside(const std::string& target) {
  const std::string stem =
      target.substr(0, target.rfind('/') + 1) + ".merge" + std::to_string(getpid()) + ".";
  for (int attempt = 0; attempt < 100; ++attempt) {
    std::string path = stem + std::to_string(attempt);
    const int file = open(path.c_str(), O_CREAT | O_EXCL | O_WRONLY | O_CLOEXEC, 0666);
    if (file >= 0) {
      close(file);
      RememberTempFile(path);
      return path;
    }
    if (errno != EEXIST) break;
  }
  return {};
}

void CopyContent(std::ifstream& from, std::ostream& to) {
  // Inserting an empty buffer counts as a failed insertion.
  if (from.peek() != std::ifstream::traits_type::eof()) to << from.rdbuf();
  if (from.bad()) to.setstate(std::ios::badbit);
}

}  // namespace

FileError::FileError(const std::string& path, int error_number)
    : std::runtime_error("Cannot write '" + path + "': " + std::strerror(error_number)) {}

FileReplacement::FileReplacement(const std::string& path) : path_(path), target_(path) {
  struct stat status = {};
  const bool exists = stat(path.c_str(), &status) == 0;
  // Before links are followed: what /dev/stdout leads to may be a pipe, which has no path.
  if (exists && !S_ISREG(status.st_mode)) {
    OpenInPlace();
    return;
  }
  target_ = FollowLinks(path);
  if (exists && access(target_.c_str(), W_OK) != 0) throw FileError(path_, errno);
  beside_ = CreateBeside(target_);
  if (beside_.empty()) {
    // Any other reason (a full disk, say) must not truncate what stands there.
    if (errno != EACCES && errno != EPERM && errno != EROFS) throw FileError(path_, errno);
    OpenInPlace();
    return;
  }
  stream_.open(beside_, std::ios::binary | std::ios::trunc);
  if (!stream_) {
    const int error_number = errno;
    RemoveBeside();
    throw FileError(path_, error_number);
  }
  if (exists) chmod(beside_.c_str(), status.st_mode & 07777);
}

FileReplacement::~FileReplacement() { RemoveBeside(); }

void FileReplacement::RemoveBeside() {
  if (beside_.empty()) return;
  unlink(beside_.c_str());
  ForgetTempFile(beside_);
  beside_.clear();
}

void FileReplacement::OpenInPlace() {
  stream_.open(target_, std::ios::binary | std::ios::trunc);
  if (!stream_) throw FileError(path_, errno);
}

void FileReplacement::Close() {
  errno = 0;
  stream_.close();
  // The stream remembers that an earlier write failed, but not why; a full disk is nearly always the reason.
  if (!stream_) throw FileError(path_, errno != 0 ? errno : ENOSPC);
}

void FileReplacement::Commit() {
  Close();
  if (beside_.empty()) return;
  if (std::rename(beside_.c_str(), target_.c_str()) == 0) {
    ForgetTempFile(beside_);
    beside_.clear();
    return;
  }
  // Somebody else's file in a shared folder, or a mount point, may be written but not replaced.
  if (errno != EPERM && errno != EACCES && errno != EBUSY) throw FileError(path_, errno);
  std::ifstream text(beside_, std::ios::binary);
  if (!text) throw FileError(path_, errno);
  OpenInPlace();
  CopyContent(text, stream_);
  Close();
}

void CopyFileContent(const std::string& source, const std::string& destination) {
  std::ifstream input(source, std::ios::binary);
  // Before the destination is touched.
  if (!input) throw FileError(destination, errno);
  FileReplacement replacement(destination);
  CopyContent(input, replacement.Stream());
  replacement.Commit();
}

}  // namespace vexel_yaml
