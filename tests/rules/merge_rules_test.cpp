#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>
#include <utility>

#include "tests/support/yaml_text.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {
namespace {

using Remapper = YAMLSequenceRemapper;
using testing::ElementsAre;

TEST(MergeRules, ErrorsNameTheLineOfTheFile) {
  const std::string no_section = "Rules file must specify section before any rules e.g. [arrays]. at line ";
  const std::string format = "Invalid rule format at line ";
  const std::string action = "Invalid rule format missing action at line ";
  const std::string contains = "Invalid format of excludeIfContains specification at line ";
  const std::vector<std::pair<std::string, std::string>> cases = {
      {"# comment\n\n   \n  # indented\n", no_section + "4\n"},
      {"[arrays]\r\nset a b\r\n", no_section + "1\n"},
      {"[arrays]\n  # indented\n", action + "2\n"},
      {"[arrays]\nset", format + "2\n"},
      {"[arrays]\nset a", "Invalid format of unique key specification at line 2\n"},
      {"[exclusions]\nremove a", "Invalid format of excluded key specification at line 2\n"},
      {"[exclusions]\nexcludeIfContains a", contains + "2\n"},
      {"[exclusions]\nincludeIfContains a", contains + "2\n"},
      {"[comparisons]\nfloat a 1 2 3", format + "2\n"},
      {"[comparisons]\nint a 1", action + "2\n"},
      {"[premerge]\nlegacyBlankPremergeBase now", format + "2\n"},
      {"[premerge]\nblank", action + "2\n"},
  };
  for (const auto& [text, message] : cases) {
    EXPECT_THAT([&rules_text = text] { const ScopedRules rules(rules_text); },
                testing::ThrowsMessage<std::runtime_error>(message));
  }
}

TEST(MergeRules, FirstRuleForAListSaysHowItsElementsAreIdentified) {
  const ScopedRules rules(
      "[premerge]\nlegacyBlankPremergeBase\n[arrays] for lists\n"
      "set *.A.list  m_Id target.fileID\nplain *.*.list ignored.key\nset 1.B.list *.fileID\n");

  EXPECT_TRUE(Remapper::CheckBlankPremergeBaseEnabled());
  EXPECT_THAT(Remapper::ChooseKeyPaths(PathFromText("7.A.list")),
              ElementsAre(PathFromText("m_Id"), PathFromText("target.fileID")));
  EXPECT_THAT(Remapper::ChooseKeyPaths(PathFromText("1.B.list")), testing::IsEmpty());
  EXPECT_THAT(Remapper::ChooseKeyPaths(PathFromText("1.A.list.0")), ElementsAre(PathFromText("fileID")));
  EXPECT_THAT(Remapper::ChooseKeyPaths(PathFromText("A.list")), ElementsAre(PathFromText("fileID")));
  EXPECT_THAT(Remapper::ChooseKeyPaths(PathFromText("_")), ElementsAre(PathFromText("_")));
}

TEST(MergeRules, ExclusionsDecideByPathOrByWhatAValueHolds) {
  const ScopedRules rules(
      "[exclusions]\nexclude *.A.curve and the rest of the line\ninclude *.A.curve\nexclude *.A.*\n"
      "includeIfContains *.A.v *.fileID\nexcludeIfContains *.A.v x y\n");
  const auto mergeable = [](std::string_view value) {
    bool matched = false;
    const OwnedNode node = ValueFromText(value);
    const bool result = Remapper::IsMergeablePath(PathFromText("1.A.v"), node.get(), matched);
    return (matched ? "rule: " : "no rule: ") + std::string(result ? "yes" : "no");
  };

  EXPECT_FALSE(Remapper::IsMergeablePath(PathFromText("1.A.curve")));
  EXPECT_FALSE(Remapper::IsMergeablePath(PathFromText("1.A.other")));
  EXPECT_TRUE(Remapper::IsMergeablePath(PathFromText("1.A.curve.0")));
  EXPECT_EQ(mergeable("{x: 1, y: 2, z: 3}"), "rule: no");
  EXPECT_EQ(mergeable("{x: {fileID: 3}, y: 2}"), "rule: yes");
  EXPECT_EQ(mergeable("{x: 1, y: [2]}"), "no rule: yes");
  EXPECT_EQ(mergeable("{x: 1, y: 2, x: 3}"), "no rule: yes");
}

TEST(MergeRules, TolerancesDefaultToTheFloatsPrecisionAndToEachOther) {
  const ScopedRules rules(
      "[comparisons]\nfloat a\nfloat b 0.5\nfloat c 0.5 0.25\nfloat d much\nfloat e 0,5\nfloat a 9\n");
  const auto tolerances = [](std::string_view path) {
    const ComparisonInfo* rule = Remapper::FindComparison(PathFromText(path));
    return std::pair(rule->relativeTolerance, rule->absoluteTolerance);
  };

  EXPECT_EQ(tolerances("a"), std::pair(1.1920929e-07F, 1.1920929e-07F));
  EXPECT_EQ(tolerances("b"), std::pair(0.5F, 0.5F));
  EXPECT_EQ(tolerances("c"), std::pair(0.5F, 0.25F));
  EXPECT_EQ(tolerances("d"), std::pair(0.F, 0.F));
  EXPECT_EQ(tolerances("e"), std::pair(0.F, 0.F));
  EXPECT_EQ(Remapper::FindComparison(PathFromText("f")), nullptr);
}

TEST(SetupRules, RefusesWhatIsNoFile) {
  for (const std::string path : {"/does/not/exist", "/tmp"}) {
    EXPECT_THAT([&] { SetupRules(path); },
                testing::Throws<YAMLError>(
                    testing::Property(&YAMLError::what, "Cannot open rules file for reading:" + path)));
  }
}

}  // namespace
}  // namespace vexel_yaml
