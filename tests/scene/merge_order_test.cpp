#include "scene/merge_order.h"

#include <gtest/gtest.h>

#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

// Elements are single letters.
FieldPath Letters(const std::string& text) {
  FieldPath letters;
  for (const char letter : text) letters.push_back(YAMLScalar::Lookup(std::string(1, letter)));
  return letters;
}

std::string Merged(const std::string& base, const std::string& left, const std::string& right,
                   const std::string& members, std::optional<MergeResolve> side = std::nullopt) {
  const FieldPath wanted = Letters(members);
  const auto merged = MergeOrder<const YAMLScalar*>({Letters(base), Letters(left), Letters(right)},
                                                    {wanted.begin(), wanted.end()}, side);
  std::string text = merged.is_conflict ? "conflict " : "";
  for (const YAMLScalar* letter : merged.order) text += letter->GetText();
  return text;
}

TEST(MergeOrder, ElementsStandWhereTheSideThatPlacedThemHasThem) {
  EXPECT_EQ(Merged("abc", "cab", "abxc", "abcx"), "cabx");
  EXPECT_EQ(Merged("abc", "bca", "ac", "ac"), "ca");
  EXPECT_EQ(Merged("ab", "lmab", "rabs", "abrslm"), "lmrabs");
  EXPECT_EQ(Merged("ab", "axyb", "bxay", "abxy"), "bxay") << "both added x and y";
}

TEST(MergeOrder, TwoDifferentMovesAreAConflict) {
  EXPECT_EQ(Merged("abc", "cab", "bac", "abc"), "conflict cab");
  EXPECT_EQ(Merged("abc", "cab", "bac", "abc", MergeResolve::kBase), "abc");
  EXPECT_EQ(Merged("abc", "cabx", "ybac", "abcxy", MergeResolve::kRight), "ybxac");
  EXPECT_EQ(Merged("a", "axy", "ayzx", "axyz"), "conflict axyz");
  EXPECT_EQ(Merged("a", "axy", "ayzx", "axyz", MergeResolve::kRight), "ayzx");
  EXPECT_EQ(Merged("abc", "bxy", "aycb", "bxy"), "conflict ybx") << "right moved b behind y";
  EXPECT_EQ(Merged("abcd", "bacd", "dbca", "bcda"), "conflict bacd");
  EXPECT_EQ(Merged("abcd", "bacd", "dbc", "bcd"), "dbc") << "left moved only what right removed";
}

TEST(MergeOrder, RemovedElementsStillHoldTheirPlaces) {
  EXPECT_EQ(Merged("abc", "abx", "ayc", "axy"), "ayx");
  EXPECT_EQ(Merged("abc", "ca", "abc", "abc"), "cab");
}

TEST(MergeOrder, ALongRunOfAdditionsKeepsItsOrder) {
  ThreeOrders<uint32_t> versions;
  std::unordered_set<uint32_t> members;
  for (uint32_t i = 0; i < 100000; ++i) members.insert(versions.left.emplace_back(i));
  EXPECT_EQ(MergeOrder(versions, members).order, versions.left);
}

}  // namespace
}  // namespace vexel_yaml
