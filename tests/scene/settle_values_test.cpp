#include "scene/settle_values.h"

#include <gtest/gtest.h>

#include "diff/yaml_mapping_diff.h"
#include "scene/same_fields.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

using enum MergeResolve;

bool IsChildren(const FieldPath& path) { return path.back()->GetText() == "m_Children"; }

// One field f of one script, merged; conflicts show up behind it with the rest of their paths. A "-" stands
// for a version without it.
struct Field {
  std::string rules;

  std::string Merge(const std::string& base, const std::string& left, const std::string& right,
                    MergeResolve side = kBase) const {
    const ScopedRules scoped(rules);
    const auto b = SceneOf(base), l = SceneOf(left), r = SceneOf(right);
    RecordingConflictResolver resolver(side);
    const YAMLScalar* id = YAMLScalar::one;
    {
      const ResolverPathStep step(resolver, id);
      SettleValues(*b->Get(id)->AsMapping(), *l->Get(id)->AsMapping(), *r->Get(id)->AsMapping(), IsChildren,
                   resolver);
    }
    YAMLMappingDiff::Merge(*YAMLMappingDiff::Diff(*b, *l), *YAMLMappingDiff::Diff(*b, *r), resolver)
        ->Apply(*b);
    const YAMLNode* field = b->Get(id)->AsMapping()->First()->AsMapping()->Get(YAMLScalar::Lookup("f"));
    std::string text = field == nullptr ? "-" : field->GetYAMLString();
    for (const auto& record : resolver.GetRecords()) {
      if (record.resolution == kConflict) text += " !" + PathToString(record.path).substr(4);
    }
    return text;
  }

  static std::unique_ptr<VexelObjects> SceneOf(const std::string& value) {
    return ObjectsFromText("--- !v!114 &1\nC:\n  a: 0\n" + (value == "-" ? "" : "  f: " + value + "\n"));
  }
};

// Expects a result for each side that a conflict may be settled with, both ways round.
void ExpectConflict(const Field& field, const std::string& base, const std::string& left,
                    const std::string& right, const std::string& at, const std::string& settled_left,
                    const std::string& settled_right, const std::string& settled_base) {
  const auto expect = [&](MergeResolve side, MergeResolve mirrored, const std::string& expected) {
    EXPECT_EQ(field.Merge(base, left, right, side), expected + " !" + at);
    EXPECT_EQ(field.Merge(base, right, left, mirrored), expected + " !" + at);
  };
  expect(kLeft, kRight, settled_left);
  expect(kRight, kLeft, settled_right);
  expect(kBase, kBase, settled_base);
}

TEST(SettleValues, ARemovalAgainstAnEditIsAConflict) {
  ExpectConflict(Field(), "1", "2", "-", "f", "2", "-", "1");
  ExpectConflict(Field(), "{fileID: 1, a: 1}", "-", "{fileID: 1, a: 2}", "f", "-", "{fileID: 1, a: 2}",
                 "{fileID: 1, a: 1}");
  ExpectConflict(Field(), "[1]", "[1, 2]", "-", "f", "[1, 2]", "-", "[1]");
  ExpectConflict(Field(), "{fileID: 1}", "4", "{fileID: 2}", "f", "4", "{fileID: 2}", "{fileID: 1}");
}

TEST(SettleValues, TheSameEditIsTakenOnceAndAReorderIsNone) {
  const Field plain{"[arrays]\nplain *.C.f\n"};
  for (const Field& field : {Field(), plain}) {
    EXPECT_EQ(field.Merge("[1]", "[1, 3]", "[1, 3]"), "[1, 3]");
    EXPECT_EQ(field.Merge("[1, 2, 3]", "[3, 1, 2]", "[3, 1, 2]"), "[3, 1, 2]");
    EXPECT_EQ(field.Merge("[1]", "[1, 2, 3]", "[1, 3]"), "[1, 2, 3]");
    EXPECT_EQ(field.Merge("[{a: 1, b: 2}, 3]", "[{b: 2, a: 1}, 3]", "[{a: 1, b: 4}, 3]"),
              "[{a: 1, b: 4}, 3]");
    EXPECT_EQ(field.Merge("[{a: 1, b: 4}, 3]", "[{a: 1, b: 2}, 3]", "[{b: 2, a: 1}, 3, 5]"),
              "[{a: 1, b: 2}, 3, 5]");
  }
  EXPECT_EQ(Field().Merge("{fileID: 1, b: 2}", "{b: 2, fileID: 1}", "{b: 3, fileID: 1}"),
            "{b: 3, fileID: 1}");
  EXPECT_EQ(Field().Merge("{fileID: 1, b: 2}", "{fileID: 4, b: 2, c: 5}", "{fileID: 4, b: 3}"),
            "{fileID: 4, b: 3, c: 5}");
}

TEST(SettleValues, TwoAdditionsBecomeOne) {
  const Field field;
  EXPECT_EQ(field.Merge("-", "{fileID: 1, a: 1}", "{fileID: 1, b: 2}"), "{fileID: 1, a: 1, b: 2}");
  EXPECT_EQ(field.Merge("-", "{fileID: 6}", "{fileID: 7}"), "{fileID: 6} !f.fileID");
  EXPECT_EQ(field.Merge("-", "{fileID: 6}", "{fileID: 7}", kRight), "{fileID: 7} !f.fileID");
  EXPECT_EQ(field.Merge("-", "{x: 1, y: 1}", "{x: 1, y: 2}", kRight), "{x: 1, y: 2} !f");
  EXPECT_EQ(field.Merge("-", "[1, 2]", "[1, 3]"), "[1, 2] !f");
}

TEST(SettleValues, ElementsWithKeysAreMergedFieldByField) {
  const Field field;
  const std::string base = "[{fileID: 5, a: 1, b: 1}, {fileID: 6}, {fileID: 7}]";
  EXPECT_EQ(field.Merge(base, "[{fileID: 6}, {fileID: 7}, {fileID: 5, a: 2, b: 1}]",
                        "[{fileID: 5, a: 1, b: 2}, {fileID: 7}]"),
            "[{fileID: 7}, {fileID: 5, a: 2, b: 2}]");
  ExpectConflict(field, base, "[{fileID: 6}, {fileID: 7}]", "[{fileID: 5, a: 2, b: 1}, {fileID: 6}]", "f.0",
                 "[{fileID: 6}]", "[{fileID: 5, a: 2, b: 1}, {fileID: 6}]",
                 "[{fileID: 5, a: 1, b: 1}, {fileID: 6}]");
  ExpectConflict(field, base, "[{fileID: 5, a: 2, b: 1}, {fileID: 6}]",
                 "[{fileID: 5, a: 3, b: 4}, {fileID: 6}]", "f.0.a", "[{fileID: 5, a: 2, b: 4}, {fileID: 6}]",
                 "[{fileID: 5, a: 3, b: 4}, {fileID: 6}]", "[{fileID: 5, a: 1, b: 4}, {fileID: 6}]");
  EXPECT_EQ(
      field.Merge("[{fileID: 5}]", "[{fileID: 6, a: 1}, {fileID: 5}]", "[{fileID: 6, a: 2}, {fileID: 5}]"),
      "[{fileID: 6, a: 1}, {fileID: 5}] !f.+0.a");
  EXPECT_EQ(
      field.Merge("[{fileID: 5, l: [0, 0]}]", "[{fileID: 5, l: [0]}]", "[{fileID: 5, l: [0, 0], m: 1}]"),
      "[{fileID: 5, l: [0], m: 1}]");
}

TEST(SettleValues, ElementsWithoutKeysAreKnownByTheirPlace) {
  const Field field;
  ExpectConflict(field, "[1, 2]", "[1, 3]", "[1, 4]", "f.1", "[1, 3]", "[1, 4]", "[1, 2]");
  ExpectConflict(field, "[1, {n: 2, w: 3}, 9]", "[1, {n: 2, w: 4}, 9, 7]", "[8, 1, {n: 5, w: 3}, 9]", "f.1",
                 "[8, 1, {n: 2, w: 4}, 9, 7]", "[8, 1, {n: 5, w: 3}, 9, 7]", "[8, 1, {n: 2, w: 3}, 9, 7]");
  ExpectConflict(field, "[1, 2, 3]", "[1, 3]", "[1, 4, 3]", "f.1", "[1, 3]", "[1, 4, 3]", "[1, 2, 3]");
  EXPECT_EQ(field.Merge("[{n: 1}, {n: 2}, 3]", "[{n: 1}, {n: 5}, 3]", "[{n: 2}, {n: 1}, 3]"),
            "[{n: 5}, {n: 1}, 3]");
  EXPECT_EQ(field.Merge("[1, 2, 3, 4]", "[1, 5, 6, 4]", "[1, 2, 7, 4]", kLeft), "[1, 5, 6, 4] !f.2");
}

TEST(SettleValues, WhatBothDidToOneSlotIsAConflict) {
  const auto list = [](const std::string& ids) {
    std::string text = "[";
    for (const char id : ids) text += std::string(text.size() > 1 ? ", " : "") + "{fileID: " + id + "}";
    return text + "]";
  };
  // Filled by both, filled and taken away, filled and moved, some of several, and one element in two slots.
  const auto expect = [&](const std::string& base, const std::string& left, const std::string& right,
                          const std::string& at, const std::string& settled_left,
                          const std::string& settled_right) {
    ExpectConflict(Field(), list(base), list(left), list(right), at, list(settled_left), list(settled_right),
                   list(base));
  };
  expect("12", "32", "42", "f.0", "32", "42");
  expect("12", "32", "2", "f.0", "32", "2");
  expect("12", "34", "5", "f", "34", "5");
  expect("12", "34", "43", "f", "34", "43");
  expect("12", "32", "13", "f", "32", "13");
  expect("12", "312", "123", "f", "312", "123");
  const Field plain;
  EXPECT_EQ(plain.Merge(list("12"), list("32"), list("45"), kLeft), list("35") + " !f.0");
  EXPECT_EQ(plain.Merge(list("123"), list("312"), list("143"), kLeft), list("312") + " !f");
  // Where the lists kept their length, what is more than the slots.
  expect("12", "23", "24", "f", "23", "24");
  EXPECT_EQ(plain.Merge(list("12"), list("123"), list("24")), list("234"));
  expect("102", "120", "132", "f", "120", "132");
  // Of empty slots none is the same as another one.
  EXPECT_EQ(plain.Merge(list("01"), list("71"), list("80"), kLeft), list("70") + " !f.0");
  EXPECT_EQ(plain.Merge(list("012"), list("702"), list("710")), list("700"));
  EXPECT_EQ(Field{"[arrays]\nset *.C.f fileID\n"}.Merge(list("12"), list("32"), list("42")), list("342"));
}

TEST(SettleValues, TwoReordersAreAConflictWhereTheOrderMeansSomething) {
  ExpectConflict(Field(), "[1, 2, 3]", "[3, 1, 2]", "[2, 1, 3]", "f", "[3, 1, 2]", "[2, 1, 3]", "[1, 2, 3]");
  EXPECT_EQ(Field().Merge("[1, 2, 3]", "[3, 1, 2]", "[1, 2, 3, 4]"), "[3, 4, 1, 2]");
  EXPECT_EQ(Field{"[arrays]\nset *.C.f k\n"}.Merge("[{k: 1}, {k: 2}, {k: 3}]", "[{k: 3}, {k: 1}, {k: 2}]",
                                                   "[{k: 2}, {k: 1}, {k: 3}]"),
            "[{k: 3}, {k: 1}, {k: 2}]");
}

TEST(SettleValues, WhatOthersSettleIsLeftAlone) {
  const auto merge = [](const std::string& base) {
    return Field().Merge(base, "{fileID: 1, m_Children: [2]}", "{fileID: 1, m_Children: [3]}");
  };
  EXPECT_EQ(merge("{fileID: 1, m_Children: [1]}"), "{fileID: 1, m_Children: [2, 3]}") << "as the engine does";
  EXPECT_EQ(merge("-"), "{fileID: 1, m_Children: [2]}");
}

TEST(SettleValues, WhatCantBeLinedUpIsOneConflict) {
  const auto expect = [](const std::string& rules, const std::string& base, const std::string& left,
                         const std::string& right) {
    ExpectConflict(Field{rules}, base, left, right, "f", left, right, base);
  };
  expect("[exclusions]\nexclude *.C.f\n", "[1, 2, 3]", "[2, 3]", "[1, 2]");
  expect("", "[1, 2, 3]", "[1, 4, 5, 3]", "[1, 6, 3]");
  expect("", "[0, 5, 0]", "[5, 0, 0]", "[0, 0]");
  // One that a side moved and edited, and the other one too, or removed.
  expect("", "[{n: 1, w: 1}, 5]", "[5, {n: 1, w: 2}]", "[5, {n: 1, w: 3}]");
  expect("", "[{n: 1, w: 1}, 5]", "[5]", "[5, {n: 1, w: 3}]");
  EXPECT_EQ(Field().Merge("[{n: 1, w: 1}, 5]", "[5]", "[5, {n: 2, w: 3}]"), "[5, {n: 2, w: 3}]");
}

TEST(SettleValues, EqualElementsAreNoProblemWhereTheyStandStill) {
  EXPECT_EQ(Field().Merge("[0, 0, 1]", "[7, 0, 0, 1]", "[0, 0, 1, 8]"), "[7, 0, 0, 1, 8]");
  EXPECT_EQ(Field().Merge("[0, 0, 9, 0, 0]", "[0, 9, 0, 0]", "[0, 0, 9, 0, 5]"), "[0, 9, 0, 5]");
  EXPECT_EQ(Field().Merge("[0, 0]", "[0, 0, 1]", "[0, 0, 2]"), "[0, 0, 1, 2]");
  EXPECT_EQ(Field().Merge("[0, 0]", "[0]", "[0, 0]"), "[0]");
  EXPECT_EQ(Field().Merge("{fileID: 1, l: [0, 0]}", "{fileID: 1, l: [0]}", "{fileID: 2, l: [0, 0]}"),
            "{fileID: 2, l: [0]}");
}

TEST(HaveSameFields, OrderOfKeysAndLastDigitsAreNoEdits) {
  const ScopedRules rules("[comparisons]\nfloat *.Transform.*.x 0.0001\nfloat *.Transform.*.*.x 0.0001\n");
  const auto are_same = [](const char* a, const char* b) {
    FieldPath path = PathFromText("4.Transform.m_Field");
    return HaveSameFields(path, ValueFromText(a).get(), ValueFromText(b).get());
  };
  EXPECT_TRUE(are_same("{a: 1, b: {c: 2, d: 3}}", "{b: {d: 3, c: 2}, a: 1}"));
  EXPECT_TRUE(are_same("[{x: 1, y: 2}, [2]]", "[{y: 2, x: 1.000001}, [2]]"));
  EXPECT_FALSE(are_same("{x: 1, y: 2}", "{x: 1, y: 2.000001}"));
  EXPECT_FALSE(are_same("{x: 1}", "{x: 1, y: 2}"));
  EXPECT_FALSE(are_same("[1, 2]", "[2, 1]"));
  EXPECT_FALSE(are_same("[]", "{}"));
}

}  // namespace
}  // namespace vexel_yaml
