#include "platform/read_whole_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <thread>

#include "platform/file_error.h"

namespace vexel_yaml {

namespace {

int OpenPatiently(const std::string& path) {
  for (int attempt = 0;; ++attempt) {
    const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC);
    if (descriptor >= 0 || attempt == 50) return descriptor;
    // Where descriptors are few, another reader of this process may be about to give one back.
    if (errno == EMFILE || errno == ENFILE) {
      std::this_thread::sleep_for(std::chrono::milliseconds(5));
    } else if (errno != EINTR) {
      return descriptor;
    }
  }
}

class Descriptor {
 public:
  explicit Descriptor(int number) : number_(number) {}
  Descriptor(const Descriptor&) = delete;
  Descriptor& operator=(const Descriptor&) = delete;
  ~Descriptor() { close(number_); }
  int Get() const { return number_; }

 private:
  int number_;
};

template <typename Text>
std::optional<Text> Read(const std::string& path) {
  const int opened = OpenPatiently(path);
  if (opened < 0) return std::nullopt;
  const Descriptor file(opened);
  struct stat status = {};
  if (fstat(file.Get(), &status) != 0) throw FileError(FileError::Step::kReading, path, errno);
  if (S_ISDIR(status.st_mode)) {
    errno = EISDIR;
    return std::nullopt;
  }
  constexpr size_t kPiece = 65536;
  Text text;
  // One byte more than there should be, so that the end is seen without growing the text.
  size_t room = S_ISREG(status.st_mode) ? static_cast<size_t>(status.st_size) + 1 : kPiece;
  for (size_t size = 0;;) {
    if (size == text.size()) text.resize(size + std::max(room, size / 2));
    room = kPiece;
    const ssize_t count = read(file.Get(), text.data() + size, text.size() - size);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) throw FileError(FileError::Step::kReading, path, errno);
    size += static_cast<size_t>(count);
    if (count > 0) continue;
    text.resize(size);
    return text;
  }
}

}  // namespace

std::optional<std::string> ReadWholeFile(const std::string& path) { return Read<std::string>(path); }

std::optional<FileText> ReadFileText(const std::string& path) { return Read<FileText>(path); }

}  // namespace vexel_yaml
