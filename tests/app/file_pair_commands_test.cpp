#include "app/file_pair_commands.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

// Works in a folder of its own, which is the current one, once without and once with threads.
class FilePairCommands : public ::testing::TestWithParam<bool> {
 protected:
  FilePairCommands() {
    std::string pattern = ::testing::TempDir() + "pairXXXXXX";
    folder_ = mkdtemp(pattern.data());
    std::filesystem::current_path(folder_);
    std::ofstream("rules.txt") << "";
    std::ofstream("old") << "%YAML 1.1\n%TAG !v! tag:x,2011:\n--- !v!1 &1\nA: {b: 1}\n";
  }
  ~FilePairCommands() override {
    std::filesystem::current_path(previous_);
    std::filesystem::remove_all(folder_);
  }

  // What a command on two equal files printed, the milliseconds as "#".
  template <typename Config>
  std::string Run(int (*command)(const Config&), const std::string& output) {
    Config config;
    config.first_path = config.second_path = "old";
    config.output_path = output;
    config.rules_file = "rules.txt";
    config.timing = true;
    config.threads = GetParam();
    ::testing::internal::CaptureStdout();
    EXPECT_EQ(command(config), 0);
    const ScopedRules emptied("");
    const std::string printed = ::testing::internal::GetCapturedStdout();
    // Each time that was measured is a "#".
    std::string text;
    std::istringstream lines(printed);
    for (std::string line; std::getline(lines, line);) {
      const size_t number = line.find_last_not_of("0123456789") + 1;
      const bool timed = number < line.size() && number >= 2 && line.compare(number - 2, 2, ": ") == 0;
      text += (timed ? line.substr(0, number) + "#" : line) + "\n";
    }
    return text;
  }

  const std::filesystem::path previous_ = std::filesystem::current_path();
  std::string folder_;
};

INSTANTIATE_TEST_SUITE_P(Threads, FilePairCommands, ::testing::Bool());

TEST_P(FilePairCommands, StepsAreTimedFromTheInsideOut) {
  const std::string steps =
      std::string("  Reading unique keys: #\n") +
      (GetParam() ? "  Read base, left and right: #\n" : "  Read base: #\n  Read left: #\n") +
      "    Preprocess mappings: #\n  Creating mappings: #\n    Creating left diff: #\n  Creating diff: #\n";
  EXPECT_EQ(Run(HandleDiffCommand, ""), steps + "Diff 'old' vs. 'old':\n  Output diff: #\nDiff Command: #\n");
  EXPECT_EQ(Run(HandleStripCommand, "out"), steps + "  Output result: #\nStrip Command: #\n");
}

}  // namespace
}  // namespace vexel_yaml
