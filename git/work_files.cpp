#include "git/work_files.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <utility>

#include "git/shown_text.h"
#include "platform/descriptor_buffer.h"
#include "platform/file_error.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/read_whole_file.h"
#include "platform/temporary_files.h"

namespace vexel_yaml {

namespace {

mode_t UserMask() {
  const mode_t mask = umask(077);
  umask(mask);
  return mask;
}

bool Write(int descriptor, std::string_view text) {
  DescriptorBuffer buffer(descriptor);
  buffer.sputn(text.data(), static_cast<std::streamsize>(text.size()));
  buffer.pubsync();
  return buffer.GetErrorNumber() == 0 && buffer.GetCount() == text.size();
}

std::string FolderOf(const std::string& path) { return path.substr(0, path.rfind('/') + 1); }

}  // namespace

bool IsLink(const std::string& path) {
  struct stat status = {};
  return lstat(path.c_str(), &status) == 0 && S_ISLNK(status.st_mode);
}

bool IsFile(const std::string& path) {
  struct stat status = {};
  return stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

bool IsFolder(const std::string& path) {
  struct stat status = {};
  return stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

bool PutFile(const std::string& path, std::string_view text, mode_t mode) {
  struct stat old = {};
  const bool exists = lstat(path.c_str(), &old) == 0;
  if (exists && !S_ISREG(old.st_mode)) return false;
  std::string work_file = FolderOf(path) + ".vexel-XXXXXX";
  const int descriptor = OpenTempFile(work_file);
  if (descriptor < 0) return false;
  bool is_written = Write(descriptor, text);
  // A file system without either leaves what a new file has there.
  const bool is_ours = old.st_uid == geteuid() && old.st_gid == getegid();
  if (exists && !is_ours && fchown(descriptor, old.st_uid, old.st_gid) != 0) errno = 0;
  fchmod(descriptor, exists ? old.st_mode & 07777 : mode & ~UserMask());
  is_written = close(descriptor) == 0 && is_written;
  // Git doesn't wait for the disk either: after a crash there is a merge to be made once more.
  if (is_written && std::rename(work_file.c_str(), path.c_str()) == 0) {
    ForgetTempFile(work_file);
    return true;
  }
  RemoveTempFile(work_file);
  return false;
}

void ReplaceOwnFile(const std::string& path, std::string_view text) {
  if (!PutFile(TargetOf(path), text)) throw CommandError("cannot write " + path);
}

std::string TargetOf(const std::string& path) {
  std::error_code error;
  const std::filesystem::path target = FollowLinks(path);
  const std::filesystem::path folder = target.has_parent_path() ? target.parent_path() : ".";
  return (std::filesystem::canonical(folder, error) / target.filename()).string();
}

bool IsPlain(const std::string& path) {
  for (size_t end = path.find('/');; end = path.find('/', end + 1)) {
    const std::string way = "./" + path.substr(0, end);
    if (IsLink(way)) return false;
    if (end == std::string::npos) break;
  }
  std::error_code error;
  return !std::filesystem::exists("./" + path, error) || IsFile("./" + path);
}

bool LeavesTop(const std::string& path) {
  std::error_code error;
  std::string top = std::filesystem::current_path(error).string();
  if (!top.ends_with('/')) top += '/';
  for (std::string way = path; !way.empty();
       way.resize(way.rfind('/') == std::string::npos ? 0 : way.rfind('/'))) {
    if (!IsLink(way)) continue;
    const std::string folder = std::filesystem::canonical(FolderOf(way), error).string() + "/";
    if (folder.starts_with(top)) return true;
  }
  return false;
}

bool MakeFoldersFor(const std::string& path) {
  const std::string folder = FolderOf(path);
  std::error_code error;
  if (!folder.empty()) std::filesystem::create_directories(folder, error);
  return !error;
}

bool IsEmpty(const std::string& path) {
  struct stat status = {};
  return stat(path.c_str(), &status) != 0 || status.st_size == 0;
}

std::string TextOf(const std::string& path) {
  std::optional<std::string> text = ReadWholeFile(path);
  if (!text && errno != ENOENT && errno != ENOTDIR && errno != EISDIR) {
    throw FileError(FileError::Step::kReading, path, errno);
  }
  return std::move(text).value_or("");
}

std::vector<std::string> PathsIn(const std::string& folder) {
  std::vector<std::string> paths;
  std::error_code error;
  for (std::filesystem::directory_iterator file(folder, error); !error && file != end(file);
       file.increment(error)) {
    paths.push_back(file->path().string());
  }
  const bool is_there = error != std::errc::no_such_file_or_directory && error != std::errc::not_a_directory;
  if (error && is_there) throw FileError(FileError::Step::kReading, folder, error.value());
  return paths;
}

bool IsAsset(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  if (!file && FileExists(path)) throw FileError(FileError::Step::kReading, path, errno);
  std::string beginning(5, '\0');
  file.read(beginning.data(), 5);
  // Git would merge as text what is taken for a file of another kind.
  if (file.bad()) throw FileError(FileError::Step::kReading, path, errno);
  return beginning == "%YAML";
}

bool MakeCopy(std::string& pattern, std::string_view text) {
  const int descriptor = mkstemp(pattern.data());
  if (descriptor < 0) return false;
  const bool is_written = Write(descriptor, text);
  if (close(descriptor) == 0 && is_written) return true;
  unlink(pattern.c_str());
  return false;
}

}  // namespace vexel_yaml
