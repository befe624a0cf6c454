#include "app/command_line.h"

#include <gtest/gtest.h>

#include <initializer_list>
#include <sstream>

#include "platform/error_channel.h"

namespace vexel_yaml {
namespace {

CommandLineArguments Words(const std::string& words) {
  CommandLineArguments arguments = {"VexelYAMLMerge"};
  std::istringstream stream(words);
  for (std::string word; stream >> word;) arguments.push_back(word);
  return arguments;
}

std::string Join(std::initializer_list<std::string> texts) {
  std::string joined;
  for (const std::string& text : texts) joined += text + ' ';
  return joined;
}

class CommandLine : public ::testing::Test {
 protected:
  ~CommandLine() override {
    errs.str("");
    gHeadlessEnabled = false;
  }
};

TEST_F(CommandLine, MergeTakesOptionsUpToTheFirstPath) {
  const std::string options =
      "-h -i -l --rules R --typeInfo T -p --nothreads --describe --fallback none -o O ";
  const std::string paths = "base -l right dest pre_base pre_right ";
  MergeConfig config;
  ASSERT_TRUE(ParseMergeArgs(Words("merge " + options + paths + "ignored"), 2, config));
  EXPECT_TRUE(gHeadlessEnabled && config.premerge && config.describe);
  EXPECT_EQ(config.resolve_mode, kResolveToLeft);
  EXPECT_FALSE(config.threads || config.force || config.timing);
  EXPECT_EQ(Join({config.merge_file, config.conflict_file, config.rules_file, config.type_info_file,
                  config.fallback_spec_file}),
            "-l O R T none ");
  EXPECT_EQ(Join({config.base_path, config.left_path, config.right_path, config.destination_path,
                  config.premerge_base_destination, config.premerge_right_destination}),
            paths);

  MergeConfig right;
  ASSERT_TRUE(ParseMergeArgs(Words("merge -r --bogus b c"), 2, right));
  EXPECT_EQ(right.resolve_mode, kResolveToRight);
  EXPECT_EQ(Join({right.base_path, right.left_path, right.destination_path}), "--bogus b  ");
}

TEST_F(CommandLine, DiffTakesItsOutputAsAThirdPath) {
  DiffConfig config;
  ASSERT_TRUE(ParseDiffArgs(Words("diff --timing a b out ignored"), 2, config));
  EXPECT_EQ(Join({config.first_path, config.second_path, config.output_path}), "a b out ");
}

}  // namespace
}  // namespace vexel_yaml
