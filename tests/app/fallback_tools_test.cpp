#include "app/fallback_tools.h"

#include <gtest/gtest.h>

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <utility>

#include "app/fallback_spec_file.h"
#include "platform/error_channel.h"
#include "platform/file_error.h"
#include "platform/files.h"

namespace vexel_yaml {
namespace {

// Works in a folder whose own name a shell would expand if it were not escaped.
class FallbackTools : public ::testing::Test {
 protected:
  FallbackTools() {
    std::string pattern = ::testing::TempDir() + "fallbackXXXXXX";
    root_ = mkdtemp(pattern.data());
    folder_ = root_ + "/it's \"$HOME\" $(id) `id` %r \\";
    std::filesystem::create_directories(folder_);
    setenv("HOME", folder_.c_str(), 1);
  }
  ~FallbackTools() override {
    setenv("HOME", home_.c_str(), 1);
    std::filesystem::remove_all(root_);
    errs.str("");
  }

  std::string Write(const std::string& name, const std::string& text) const {
    std::ofstream(folder_ + "/" + name) << text;
    return folder_ + "/" + name;
  }
  // The base file is the script that plays the merge tool; $1, $2 and $3 are left, right and destination.
  int RunScript(const std::string& script, const std::string& spec) const {
    return FallbackMergeTool(Write("base", script), Write("left", "L"), Write("right", "R"),
                             folder_ + "/dest", Write("spec", spec));
  }

  std::string root_;
  std::string folder_;
  const std::string home_ = GetUserHomeDir();
};

TEST_F(FallbackTools, PathsReachTheToolUnchanged) {
  EXPECT_EQ(RunScript("cat \"$1\" \"$2\" >\"$3\"", "* use \"/bin/sh\" \"%b\" \"%l\" \"%r\" \"%d\"\r\n"), 0);
  EXPECT_FALSE(IsFileEmpty(folder_ + "/dest"));
  EXPECT_EQ(SubstituteMergePlaceholderFilePaths("%b%l %% %x %", "%l", "`", "r", "d"), "%l\\` %% %x %");
}

TEST_F(FallbackTools, ToolsStatusIsTheExitStatus) {
  const auto previous = std::signal(SIGPIPE, SIG_IGN);
  const std::string tool = "* use \"/bin/sh\" \"%b\"";
  const std::pair<std::string, int> cases[] = {
      {"exit 0", 0}, {"exit 1", 1}, {"kill -TERM $$", 143}, {"kill -PIPE $$", 141}};
  for (const auto& [script, status] : cases) {
    EXPECT_EQ(ExitStatusOfTool(RunScript(script, tool)), status) << script;
  }
  EXPECT_TRUE(FileExists(folder_ + "/dest")) << "made although the template doesn't name it";
  EXPECT_EQ(std::signal(SIGPIPE, previous), SIG_IGN);
  EXPECT_EQ(errs.str(), "") << "a missing destination is no reason to say that the tool did not start";
  for (const int nothing_ran : {-1, 1}) EXPECT_EQ(ExitStatusOfTool(nothing_ran), 1);
  EXPECT_THROW(FallbackMergeTool("b", "l", "r", folder_ + "/none/dest", folder_ + "/spec"), FileError);
}

TEST_F(FallbackTools, TheUsersHiddenFileComesFirst) {
  EXPECT_EQ(GetSpecFilename("auto"), GetDataFilesDir() + "mergespecfile.txt");
  const std::string own = Write(".mergespecfile.txt", "");
  EXPECT_EQ(GetSpecFilename("auto"), own);
}

}  // namespace
}  // namespace vexel_yaml
