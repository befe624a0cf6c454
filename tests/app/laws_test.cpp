#include "app/laws.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <iterator>

#include "app/lost_edits.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

// For long runs outside the suite.
uint32_t FromEnvironment(const char* name, uint32_t otherwise) {
  const char* text = std::getenv(name);
  return text == nullptr ? otherwise : static_cast<uint32_t>(std::stoul(text));
}

TEST(Laws, HoldOnRandomScenes) {
  const std::string here = __FILE__;
  std::ifstream file(here.substr(0, here.rfind("tests/app")) + "data/mergerules.txt");
  ASSERT_TRUE(file);
  const ScopedRules rules(std::string(std::istreambuf_iterator<char>(file), {}));

  const uint32_t count = FromEnvironment("VEXEL_LAW_TRIPLES", 2000);
  const uint32_t first = FromEnvironment("VEXEL_LAW_FIRST_SEED", 0);
  Laws laws;
  uint32_t unmatchable = 0;
  for (uint32_t seed = first; seed < first + count; ++seed) {
    if (!laws.Check(RandomTriple(seed)).empty()) ++unmatchable;
  }
  for (const Laws::Result& result : laws.GetResults()) {
    EXPECT_EQ(result.broken, 0U) << result.law << ", for example\n" << result.example;
    EXPECT_GT(result.checked, count / 3) << result.law;
  }
  EXPECT_LE(unmatchable, count / 50);
}

TEST(LostEdits, AreFoundInListsThatBothSidesEdited) {
  const ScopedRules rules("[arrays]\nset *.C.keyed id\n");
  const RecordingConflictResolver no_conflicts(MergeResolve::kBase);
  const auto lost = [&](const std::string& field, const std::string& base, const std::string& side,
                        const std::string& other, const std::string& merged) {
    const auto scene = [&](const std::string& list) {
      return ObjectsFromText("--- !v!1 &1\nC:\n  " + field + ": " + list + "\n");
    };
    return IsAnythingLost(*scene(base), *scene(side), *scene(other), *scene(merged), no_conflicts);
  };
  EXPECT_FALSE(lost("list", "[a, b]", "[a, x, b, x]", "[y, a]", "[y, a, x, x]"));
  EXPECT_TRUE(lost("list", "[a, b]", "[a, x, b, x]", "[y, a]", "[y, a, x]"));
  EXPECT_TRUE(lost("list", "[a, b]", "[a]", "[y, a, b]", "[y, a, b]"));
  // An edit inside an element that only one side touched; what both edited may look like neither.
  const std::string base = "[{id: 1, v: 1}, {id: 2, v: 1}]", side = "[{id: 1, v: 2}, {id: 2, v: 2}]";
  const std::string other = "[{id: 1, v: 1}, {id: 2, v: 1, w: 1}, {id: 3}]";
  EXPECT_FALSE(lost("keyed", base, side, other, "[{id: 1, v: 2}, {id: 2, v: 2, w: 1}, {id: 3}]"));
  EXPECT_TRUE(lost("keyed", base, side, other, "[{id: 1, v: 1}, {id: 2, v: 2, w: 1}, {id: 3}]"));
  EXPECT_TRUE(lost("keyed", base, side, other, "[{id: 1, v: 2}, {id: 2, v: 1, w: 1}, {id: 3}]"));
}

}  // namespace
}  // namespace vexel_yaml
