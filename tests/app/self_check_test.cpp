#include "app/self_check.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "tests/support/yaml_text.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {
namespace {

// The result of the self-check, or the error that it threw.
std::string Check(const std::string& base, const std::string& left, const std::string& right) {
  ::testing::internal::CaptureStdout();
  std::string error;
  try {
    EXPECT_EQ(HandleUnittestCommand({"VexelYAMLMerge", "unittest", base, left, right}), 0);
  } catch (const YAMLError& caught) {
    error = caught.what();
  }
  const ScopedRules emptied("");
  return ::testing::internal::GetCapturedStdout() + error;
}

TEST(SelfCheck, HoldsOnTheUsersScenesOrSaysWhichCannotBeRead) {
  std::string folder = ::testing::TempDir() + "checkXXXXXX";
  ASSERT_NE(mkdtemp(folder.data()), nullptr);
  const auto write = [&](const std::string& name, const std::string& documents) {
    std::ofstream(folder + "/" + name) << "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n" << documents;
    return folder + "/" + name;
  };
  // The transitions repeat a key, and both sides add an object under one file ID.
  const std::string machine =
      "--- !v!1107 &7\nAnimatorStateMachine:\n  m_StateMachineTransitions:\n"
      "    data: {first: {fileID: 1}}\n    data: {first: {fileID: 2}}\n";
  const std::string base = write("base", machine);
  EXPECT_THAT(Check(base, write("left", machine + "--- !v!108 &12\nLight: {}\n"),
                    write("right", machine + "--- !v!33 &12\nMeshFilter: {}\n")),
              testing::AllOf(testing::Not(testing::HasSubstr("(0 checks")),
                             testing::EndsWith("\n10 passed, 0 failed\n")));

  EXPECT_EQ(Check(base, base, "/none"), "Error parsing file '/none': Cannot open file");
  EXPECT_THAT(Check(base, write("twice", "--- !v!1 &1\nA:\n  b: 1\n  b: 2\n"), base),
              testing::HasSubstr(folder + "/twice"));
  std::filesystem::remove_all(folder);
}

}  // namespace
}  // namespace vexel_yaml
