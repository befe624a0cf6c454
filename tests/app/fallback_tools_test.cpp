#include "app/fallback_tools.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "platform/error_channel.h"
#include "platform/file_error.h"

namespace vexel_yaml {
namespace {

TEST(FallbackTools, TheDestinationIsThereBeforeTheToolStarts) {
  const std::string folder = ::testing::TempDir() + "fallback" + std::to_string(getpid()) + "/";
  std::filesystem::create_directory(folder);
  std::ofstream(folder + "spec") << "* use \"/bin/true\" \"%b\"\n";
  const auto run = [&](const std::string& destination) {
    return FallbackMergeTool("b", "l", "r", folder + destination, folder + "spec");
  };
  EXPECT_EQ(run("new"), 0);
  EXPECT_TRUE(std::filesystem::exists(folder + "new")) << "although the template doesn't name it";
  EXPECT_EQ(errs.str(), "") << "a missing destination is no reason to say that the tool did not start";
  EXPECT_THROW(run("none/new"), FileError);
  std::filesystem::remove_all(folder);
}

}  // namespace
}  // namespace vexel_yaml
