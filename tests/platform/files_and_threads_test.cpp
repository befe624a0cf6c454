#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <ostream>
#include <streambuf>
#include <thread>

#include "platform/file_replacement.h"
#include "platform/read_whole_file.h"
#include "platform/temporary_files.h"
#include "platform/thread.h"
#include "platform/timer_stat.h"

namespace vexel_yaml {
namespace {

namespace fs = std::filesystem;

const std::string kFolder = testing::TempDir() + "files_test." + std::to_string(getpid()) + "/";
const std::string kFile = kFolder + "file";

// What the error says, empty for a success.
std::string Replace(const std::string& path, std::string_view text) try {
  FileReplacement file(path);
  file.Stream() << text;
  file.Commit();
  return {};
} catch (const FileError& error) {
  return error.what();
}

TEST(FileReplacement, ReplacesTheTargetOfALinkOrNothing) {
  fs::create_directory(kFolder);
  Replace(kFile, "old");
  fs::permissions(kFile, fs::perms(0666));
  fs::create_symlink("file", kFolder + "link");
  EXPECT_EQ(Replace(kFolder + "link", "longer"), "");
  EXPECT_EQ(fs::status(kFile).permissions(), fs::perms(0666));

  // Stands for a disk that gets full in the middle of the text.
  rlimit limit = {};
  getrlimit(RLIMIT_FSIZE, &limit);
  const rlimit small = {4096, limit.rlim_max};
  std::signal(SIGXFSZ, SIG_IGN);
  setrlimit(RLIMIT_FSIZE, &small);
  EXPECT_NE(Replace(kFile, std::string(100'000, 'x')), "");
  setrlimit(RLIMIT_FSIZE, &limit);
  EXPECT_EQ(fs::file_size(kFile), 6);
  EXPECT_EQ(std::distance(fs::directory_iterator(kFolder), {}), 2);
  EXPECT_EQ(Replace("/dev/full", "x"), "Cannot write '/dev/full': No space left on device");

  const auto replace_as_ordinary_user = [] {
    if (geteuid() == 0 && setuid(65534) != 0) _exit(2);
    std::string said = Replace(kFile, std::string(100'000, 'x'));
    if (fs::file_size(kFile) != 100'000) said = "too short";
    said += Replace(kFile, "in place");
    fputs((said + Replace(kFolder + "new", "")).c_str(), stderr);
    _exit(0);
  };
  fs::permissions(kFolder, fs::perms(0555));
  EXPECT_EXIT(replace_as_ordinary_user(), testing::ExitedWithCode(0), "^Cannot write '.*new': Permission");
  EXPECT_EQ(ReadWholeFile(kFile), "in place");
  fs::permissions(kFolder, fs::perms(0755));
  fs::remove_all(kFolder);
}

TEST(TemporaryFiles, GoAwayAlsoAfterAnInterrupt) {
  const std::string path = CreateTempFile();
  EXPECT_EQ(fs::status(path).permissions(), fs::perms(0600));
  for (const int signal_number : {SIGINT, SIGQUIT, SIGUSR1, SIGABRT}) {
    const std::string interrupted = CreateTempFile();
    EXPECT_EXIT(raise(signal_number), testing::KilledBySignal(signal_number), "");
    EXPECT_FALSE(fs::exists(interrupted)) << signal_number;
  }
  EXPECT_FALSE(fs::exists(path));
  const std::string later = CreateTempFile();
  { const TempFilesGuard guard; }
  EXPECT_FALSE(fs::exists(later));
}

TEST(Thread, CarriesItsException) {
  Thread thread;
  thread.Start([] { throw std::length_error("far away"); });
  thread.Join();
  EXPECT_THROW(thread.CheckForExceptions(), std::length_error);
}

// Takes one character after another, as one that escapes for a terminal.
struct SlowBuffer : std::streambuf {
  int overflow(int character) override {
    std::this_thread::sleep_for(std::chrono::microseconds(1));
    text += static_cast<char>(character);
    return character;
  }
  std::string text;
};

TEST(TimerStat, ThreadsPrintOneLineAfterTheOther) {
  SlowBuffer buffer;
  std::ostream printed(&buffer);
  {
    TimerStat all("all", &printed);
    std::array<std::jthread, 4> threads;
    for (std::jthread& thread : threads) thread = std::jthread([&] { TimerStat(all, "part"); });
  }
  EXPECT_THAT(buffer.text, testing::MatchesRegex("(  part: [0-9]+\n){4}all: [0-9]+\n"));
}

}  // namespace
}  // namespace vexel_yaml
