#include "app/merge_command.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>

#include "platform/error_channel.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

const std::string kHeader = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n";
const std::string kPaths = " base.vexel left.vexel right.vexel out.vexel ";

std::string Door(const std::string& name, const std::string& layer, const std::string& tag = " Exit") {
  return kHeader + "--- !v!1 &1\nGameObject:\n  m_Name:" + name + "\n  m_Layer: " + layer +
         "\n  m_Tag:" + tag + "\n";
}

// Merges in a folder of its own, which is the current one. Left and right rename one door, and right also
// moves it to another layer.
class MergeCommand : public ::testing::Test {
 protected:
  MergeCommand() {
    std::string pattern = ::testing::TempDir() + "mergeXXXXXX";
    folder_ = mkdtemp(pattern.data());
    std::filesystem::current_path(folder_);
    Write("base.vexel", Door(" Door", "0"));
    Write("left.vexel", Door(" Gate", "0"));
    Write("right.vexel", Door(" Portal", "5"));
    Write("out.vexel", "old\n");
  }
  ~MergeCommand() override {
    std::filesystem::current_path(previous_);
    std::filesystem::remove_all(folder_);
    gHeadlessEnabled = false;
    errs.str("");
  }

  static void Write(const std::string& name, const std::string& text) { std::ofstream(name) << text; }
  static std::string Read(const std::string& name) {
    std::ifstream file(name);
    return file ? std::string(std::istreambuf_iterator<char>(file), {}) : "(no file)";
  }

  // Returns the status; `output_` is what was printed, then what was reported.
  int Merge(const std::string& words) {
    std::istringstream stream("VexelYAMLMerge merge -h --fallback none --rules " + rules_path_ + " " + words);
    MergeConfig config;
    EXPECT_TRUE(ParseMergeArgs({std::istream_iterator<std::string>(stream), {}}, 2, config));
    errs.str("");
    ::testing::internal::CaptureStdout();
    ::testing::internal::CaptureStderr();
    const int status = ProcessMergeCommand(config);
    output_ = ::testing::internal::GetCapturedStdout();
    output_ += ::testing::internal::GetCapturedStderr();
    const ScopedRules emptied("");
    return status;
  }

  const std::filesystem::path previous_ = std::filesystem::current_path();
  const std::string source_ = std::filesystem::absolute(__FILE__).string();
  const std::string rules_path_ = source_.substr(0, source_.rfind("tests/app")) + "data/mergerules.txt";
  std::string folder_;
  std::string output_;
};

TEST_F(MergeCommand, PremergedFilesDifferOnlyInWhatIsPending) {
  Write("left.vexel", Door(" Gate", "0", " Left"));
  Write("right.vexel", Door(" Portal", "5", " Right"));
  Write("choices.txt", "Conflict handling:\nright 1.GameObject.m_Tag\n");
  Write("blank.txt", "[premerge]\nlegacyBlankPremergeBase\n");
  for (const std::string option : {"", "--nothreads ", "--rules blank.txt "}) {
    EXPECT_EQ(Merge(option + "-p -i choices.txt" + kPaths + "pre_base.vexel pre_right.vexel"), 2);
    EXPECT_EQ(Read("out.vexel"), Door(" Gate", "5", " Right"));
    EXPECT_EQ(Read("pre_base.vexel"), Door(option.starts_with("--r") ? "" : " Door", "5", " Right"));
    EXPECT_EQ(Read("pre_right.vexel"), Door(" Portal", "5", " Right"));
  }
}

TEST_F(MergeCommand, ThreadsChangeNothing) {
  // More objects than are written in one go.
  std::string base = kHeader, left = kHeader, right = kHeader, merged = kHeader;
  for (int id = 1; id <= 20'000; ++id) {
    const std::string object = "--- !v!108 &" + std::to_string(id) + "\nLight:\n  m_Range: ";
    base += object + "1\n";
    left += object + (id % 100 == 0 || id % 5000 == 7 ? "2\n" : "1\n");
    right += object + (id % 100 == 50 || id % 5000 == 7 ? "3\n" : "1\n");
    merged += object + (id % 100 == 0 ? "2\n" : id % 100 == 50 ? "3\n" : "1\n");
  }
  Write("base.vexel", base);
  Write("left.vexel", left);
  Write("right.vexel", right);
  EXPECT_EQ(Merge("--describe" + kPaths), 2);
  EXPECT_TRUE(Read("out.vexel") == merged);
  const std::string records = output_;
  EXPECT_EQ(Merge("--describe --nothreads" + kPaths), 2);
  EXPECT_TRUE(Read("out.vexel") == merged && output_ == records);
}

}  // namespace
}  // namespace vexel_yaml
