#include "mapped_file.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <stdexcept>

namespace {

[[noreturn]] void Fail(const std::string& path) {
  throw std::runtime_error("'" + path + "': " + std::strerror(errno));
}

}  // namespace

std::string_view MapFile(const std::string& path) {
  const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC);
  struct stat status = {};
  if (descriptor < 0 || fstat(descriptor, &status) != 0) Fail(path);
  const auto size = static_cast<size_t>(status.st_size);
  void* bytes = mmap(nullptr, size, PROT_READ, MAP_PRIVATE, descriptor, 0);
  if (bytes == MAP_FAILED) Fail(path);
  close(descriptor);
  return {static_cast<const char*>(bytes), size};
}

std::vector<std::string_view> SplitAtHeaders(std::string_view text) {
  static constexpr std::string_view kHeader = "\n--- ";
  std::vector<std::string_view> documents;
  const char* const end = text.data() + text.size();
  const auto find = [&](const char* from) {
    const auto rest = static_cast<size_t>(end - from);
    const void* found = memmem(from, rest, kHeader.data(), kHeader.size());
    return found == nullptr ? end : static_cast<const char*>(found) + 1;
  };
  for (const char* start = find(text.data()); start != end;) {
    const char* const next = find(start);
    documents.emplace_back(start, static_cast<size_t>(next - start));
    start = next;
  }
  return documents;
}

void WriteWholeFile(const std::string& path, std::string_view text) {
  const int descriptor = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
  if (descriptor < 0) Fail(path);
  while (!text.empty()) {
    const ssize_t written = write(descriptor, text.data(), text.size());
    if (written < 0) Fail(path);
    text.remove_prefix(static_cast<size_t>(written));
  }
  if (close(descriptor) != 0) Fail(path);
}
