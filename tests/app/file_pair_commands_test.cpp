#include "app/file_pair_commands.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "tests/support/yaml_text.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {
namespace {

const std::string kHeader = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n";

// Works in a folder of its own, which is the current one, once without and once with threads.
class FilePairCommands : public ::testing::TestWithParam<bool> {
 protected:
  FilePairCommands() {
    std::string pattern = ::testing::TempDir() + "pairXXXXXX";
    folder_ = mkdtemp(pattern.data());
    std::filesystem::current_path(folder_);
    std::ofstream("rules.txt") << "[comparisons]\nfloat *.Light.m_Range 0.1 0.1\n";
    std::ofstream("old") << kHeader << "--- !v!1 &1\nA: {b: 1}\n--- !v!108 &8\nLight:\n  m_Range: 10\n";
    std::ofstream("new") << kHeader
                         << "--- !v!108 &8\nLight:\n  m_Range: 10.5\n--- !v!1 &1\nA: {b: 2, c: 3}\n";
    std::ofstream("broken") << kHeader << "--- !v!1 &1\nA: [\n";
  }
  ~FilePairCommands() override {
    std::filesystem::current_path(previous_);
    std::filesystem::remove_all(folder_);
  }

  // What a command printed, the milliseconds as "#", or the error that it threw.
  template <typename Config>
  std::string Run(int (*command)(const Config&), const std::string& first, const std::string& second,
                  const std::string& output = "", bool timing = false) {
    Config config;
    config.first_path = first;
    config.second_path = second;
    config.output_path = output;
    config.rules_file = "rules.txt";
    config.timing = timing;
    config.threads = GetParam();
    ::testing::internal::CaptureStdout();
    std::string error;
    try {
      EXPECT_EQ(command(config), 0);
    } catch (const YAMLError& caught) {
      error = caught.what();
    }
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
    return text + error;
  }

  const std::filesystem::path previous_ = std::filesystem::current_path();
  std::string folder_;
};

INSTANTIATE_TEST_SUITE_P(Threads, FilePairCommands, ::testing::Bool());

TEST_P(FilePairCommands, AnOutputFileIsReplacedEvenIfItIsTheInput) {
  const std::string stripped = kHeader + "--- !v!1 &1\nA: {b: 2, c: 3}\n";
  EXPECT_EQ(Run(HandleStripCommand, "old", "new"), stripped);
  EXPECT_EQ(Run(HandleStripCommand, "old", "new", "new"), "");
  std::stringstream text;
  text << std::ifstream("new").rdbuf();
  EXPECT_EQ(text.str(), stripped);
}

TEST_P(FilePairCommands, TheFirstFilesErrorComesFirst) {
  EXPECT_EQ(Run(HandleDiffCommand, "broken", "none").substr(0, 29), "Error parsing file 'broken': ");
  EXPECT_EQ(Run(HandleStripCommand, "none", "broken"), "Error parsing file 'none': Cannot open file");
}

TEST_P(FilePairCommands, StepsAreTimedFromTheInsideOut) {
  const std::string steps =
      std::string("  Reading unique keys: #\n") +
      (GetParam() ? "  Read base, left and right: #\n" : "  Read base: #\n  Read left: #\n") +
      "    Preprocess mappings: #\n  Creating mappings: #\n    Creating left diff: #\n  Creating diff: #\n";
  EXPECT_EQ(Run(HandleDiffCommand, "old", "old", "", true),
            steps + "Diff 'old' vs. 'old':\n  Output diff: #\nDiff Command: #\n");
  EXPECT_EQ(Run(HandleStripCommand, "old", "old", "out", true),
            steps + "  Output result: #\nStrip Command: #\n");
}

}  // namespace
}  // namespace vexel_yaml
