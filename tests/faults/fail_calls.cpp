// Preloaded into the programs under test, makes their calls of one kind fail, from a chosen one on:
//   FAULT        KIND ERROR FIRST ON, with a blank between them. KIND is what stands first in the
//   replacements below.
//                ERROR is an errno, 0 for a short count, or the negative number of a signal that follows the
//                call. The call that fails has the number FIRST, from 1 on; where ON is 1, so do all later
//                ones.
//   FAULT_COUNT  a file of 8 bytes, which takes the number of such calls, of all processes together
//   FAULT_LOG    a file, which takes a line for each new file ("made PATH") and each failure ("failed KIND
//   PLACE")
// What is written to standard error doesn't count: a message that nobody gets is no way to find anything out.

#include <dirent.h>
#include <dlfcn.h>
#include <pthread.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string_view>

namespace {

// Of <fcntl.h>, which declares what is replaced here in another way.
constexpr int kReadWrite = 02, kNew = 0300, kAppend = 02001, kCloseOnExec = 02000000;
constexpr size_t kShortCount = 100;

std::atomic<long>* calls = nullptr;  // null in what the programs start
std::array<char, 16> failing_kind;
int error = 0;
long first = 0;
int goes_on = 0;
int log_file = -1;
std::array<std::atomic<bool>, 1024> saved;  // descriptors whose content is on the disk

int OpenFileOf(const char* variable, int flags) {
  return static_cast<int>(syscall(SYS_openat, -100, std::getenv(variable), flags | kCloseOnExec, 0));
}

__attribute__((constructor)) void Start() {
  const std::string_view program = program_invocation_short_name;
  const char* fault = std::getenv("FAULT");
  constexpr std::array<std::string_view, 4> kPrograms = {"VexelYAMLMerge", "vexel-merge-git",
                                                         "vexel-merge-report", "vexel-merge-view"};
  if (fault == nullptr || std::ranges::find(kPrograms, program) == kPrograms.end()) return;
  std::sscanf(fault, "%15s %d %ld %d", failing_kind.data(), &error, &first, &goes_on);
  log_file = OpenFileOf("FAULT_LOG", kAppend);
  const int count = OpenFileOf("FAULT_COUNT", kReadWrite);
  void* shared = mmap(nullptr, sizeof *calls, PROT_READ | PROT_WRITE, MAP_SHARED, count, 0);
  calls = static_cast<std::atomic<long>*>(shared);
  syscall(SYS_close, count);
}

// In one piece, since threads write at the same time.
void Log(const char* verb, const char* kind, const char* place) {
  std::array<char, 4200> line;
  const int size = std::snprintf(line.data(), line.size(), "%s%s %s\n", verb, kind, place);
  syscall(SYS_write, log_file, line.data(), size);
}

void Log(const char* verb, const char* kind, int descriptor) {
  std::array<char, 32> link;
  std::array<char, 4096> path = {};
  std::snprintf(link.data(), link.size(), "/proc/self/fd/%d", descriptor);
  syscall(SYS_readlink, link.data(), path.data(), path.size() - 1);
  Log(verb, kind, path.data());
}

// One call, which may be one of those that fail. It sets errno once the call is over.
class Fault {
 public:
  template <typename Place>
  Fault(std::string_view kind, Place place) {
    if (calls == nullptr || kind != failing_kind.data()) return;
    const long number = ++*calls;
    due_ = number == first || (goes_on != 0 && number > first);
    if (due_) Log("failed ", failing_kind.data(), place);
  }
  Fault(const Fault&) = delete;
  Fault& operator=(const Fault&) = delete;
  ~Fault() {
    if (due_ && error < 0) kill(getpid(), -error);
    if (Fails()) errno = error;
  }

  bool Fails() const { return due_ && error > 0; }
  template <typename Number>
  Number Shorten(Number count, Number at_most) const {
    return due_ && error == 0 ? std::min(count, at_most) : count;
  }

 private:
  bool due_ = false;
};

// A disk that fails behind the cache has lost what was written: who doesn't look must be seen to lose it.
void LoseUnsaved(int file) {
  struct stat status = {};
  if (saved[file % saved.size()] || fstat(file, &status) != 0) return;
  // What can't be written has nothing to lose.
  [[maybe_unused]] const int result = ftruncate(file, status.st_size / 2);
}

int NoteNew(int file, const char* path, int flags) {
  if (calls != nullptr && file >= 0 && (flags & kNew) == kNew) Log("made", "", path);
  return file;
}

}  // namespace

// Defines the function `symbol`, with Real_symbol() for the one that it replaces. The compiler knows it by
// another name, since the headers declare some of them in ways that can't be repeated.
#define REPLACE(result, symbol, parameters)                                                             \
  extern "C" result Replaced_##symbol parameters __asm__(#symbol);                                      \
  static auto Real_##symbol() {                                                                         \
    static const auto real = reinterpret_cast<decltype(&Replaced_##symbol)>(dlsym(RTLD_NEXT, #symbol)); \
    return real;                                                                                        \
  }                                                                                                     \
  extern "C" result Replaced_##symbol parameters
#define FAIL(kind, place, failure, result, symbol, parameters, ...) \
  REPLACE(result, symbol, parameters) {                             \
    const Fault fault(kind, place);                                 \
    return fault.Fails() ? failure : Real_##symbol()(__VA_ARGS__);  \
  }
#define FAIL_OPEN(flags, symbol, parameters, ...)                                   \
  REPLACE(int, symbol, parameters) {                                                \
    const Fault fault(((flags)&kNew) == kNew ? "create" : "open", path);            \
    return fault.Fails() ? -1 : NoteNew(Real_##symbol()(__VA_ARGS__), path, flags); \
  }
#define FAIL_CLOSE(symbol, type, number)      \
  REPLACE(int, symbol, (type file)) {         \
    const Fault fault("close", number);       \
    if (fault.Fails()) LoseUnsaved(number);   \
    saved[(number) % saved.size()] = false;   \
    const int result = Real_##symbol()(file); \
    return fault.Fails() ? -1 : result;       \
  }

// clang-format off
FAIL_OPEN(flags, open, (const char* path, int flags, int mode), path, flags, mode)
FAIL_OPEN(kNew, mkstemp, (char* path), path)
FAIL("open", path, nullptr, FILE*, fopen64, (const char* path, const char* mode), path, mode)
FAIL("open", path, nullptr, DIR*, opendir, (const char* path), path)
FAIL("read", file, -1, ssize_t, read, (int file, void* to, size_t size), file, to, fault.Shorten(size, kShortCount))
FAIL(file == STDERR_FILENO ? "" : "write", file, -1, ssize_t, write, (int file, const void* from, size_t size), file,
     from, fault.Shorten(size, kShortCount))
FAIL("write", file, -1, ssize_t, writev, (int file, const iovec* pieces, int count), file, pieces,
     fault.Shorten(count, 1))
// Of standard output, whose buffer is the C library's.
FAIL(file == stdout ? "write" : "", STDOUT_FILENO, 0, size_t, fwrite,
     (const void* from, size_t size, size_t count, FILE* file), from, size, count, file)
FAIL(file == stdout ? "write" : "", STDOUT_FILENO, EOF, int, fflush, (FILE* file), file)
FAIL("rename", to, -1, int, rename, (const char* from, const char* to), from, to)
FAIL("unlink", path, -1, int, unlink, (const char* path), path)
FAIL("mode", file, -1, int, fchmod, (int file, mode_t mode), file, mode)
FAIL("thread", "", error, int, pthread_create,
     (pthread_t* thread, const pthread_attr_t* kind, void* (*run)(void*), void* with), thread, kind, run, with)
FAIL("process", command, -1, int, system, (const char* command), command)
FAIL("memory", "", nullptr, void*, malloc, (size_t size), size)
FAIL("memory", "", nullptr, void*, calloc, (size_t count, size_t size), count, size)
FAIL("memory", "", nullptr, void*, realloc, (void* old, size_t size), old, size)
FAIL("memory", "", error, int, posix_memalign, (void** to, size_t alignment, size_t size), to, alignment, size)
FAIL_CLOSE(close, int, file)
FAIL_CLOSE(fclose, FILE*, fileno(file))
// clang-format on

REPLACE(int, fsync, (int file)) {
  const Fault fault("fsync", file);
  if (fault.Fails()) LoseUnsaved(file);
  saved[file % saved.size()] = !fault.Fails();
  return fault.Fails() ? -1 : Real_fsync()(file);
}
