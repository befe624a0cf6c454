#include "app/laws.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <iterator>

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
    if (!laws.Check(RandomTriple(seed))) ++unmatchable;
  }
  for (const Laws::Result& result : laws.GetResults()) {
    EXPECT_EQ(result.broken, 0U) << result.law << ", for example\n" << result.example;
    EXPECT_GT(result.checked, count / 3) << result.law;
  }
  EXPECT_LE(unmatchable, count / 50);
}

}  // namespace
}  // namespace vexel_yaml
