#include "scene/same_fields.h"

#include <gtest/gtest.h>

#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

bool AreSame(const std::string& a, const std::string& b) {
  const ScopedRules rules("[comparisons]\nfloat *.Transform.*.x 0.0001\nfloat *.Transform.*.*.x 0.0001\n");
  FieldPath path = PathFromText("4.Transform.m_Field");
  const bool same = HaveSameFields(path, ValueFromText(a).get(), ValueFromText(b).get());
  EXPECT_EQ(path, PathFromText("4.Transform.m_Field"));
  EXPECT_EQ(HaveSameFields(path, ValueFromText(b).get(), ValueFromText(a).get()), same);
  return same;
}

TEST(HaveSameFields, OrderOfKeysAndLastDigitsAreNoEdits) {
  EXPECT_TRUE(AreSame("{a: 1, b: {c: 2, d: 3}}", "{b: {d: 3, c: 2}, a: 1}"));
  EXPECT_TRUE(AreSame("{x: 1, y: 2}", "{y: 2, x: 1.000001}"));
  EXPECT_TRUE(AreSame("[{x: 1}, [2]]", "[{x: 1.000001}, [2]]"));
  EXPECT_FALSE(AreSame("{x: 1, y: 2}", "{x: 1, y: 2.000001}"));
  EXPECT_FALSE(AreSame("{x: 1}", "{x: 1, y: 2}"));
  EXPECT_FALSE(AreSame("{x: 1}", "{y: 1}"));
  EXPECT_FALSE(AreSame("[1, 2]", "[2, 1]"));
  EXPECT_FALSE(AreSame("[1]", "[1, 2]"));
  EXPECT_FALSE(AreSame("[]", "{}"));
}

}  // namespace
}  // namespace vexel_yaml
