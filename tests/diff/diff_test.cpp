#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <sstream>

#include "diff/merge_tree_visitor.h"
#include "diff/yaml_diff_output.h"
#include "tests/support/yaml_text.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {
namespace {

const YAMLScalar* Key(std::string_view text) { return YAMLScalar::Lookup(text); }
const Operation* Add(std::string_view text) { return YAMLAlloc<AddOperation>::create(Key(text), true); }
const Operation* Remove() { return YAMLAlloc<RemoveOperation>::create(true); }

// The kind of operation that a change at `path` gives, with its mark.
std::string Change(std::string_view from, std::string_view to, std::string_view path = "1.A.field") {
  constexpr const char* kKinds[] = {"remove", "change", "add", "change mapping", "change sequence"};
  FieldPath steps = PathFromText(path);
  const Operation* made = CreateDiffOperation(steps, ValueFromText(from).get(), ValueFromText(to).get());
  if (made == nullptr) return "none";
  return std::string(kKinds[static_cast<size_t>(made->GetKind())]) +
         (made->IsMergeable() ? ", mergeable" : "");
}

TEST(CreateDiff, WhatIsAUnit) {
  EXPECT_EQ(Change("{x: 1, y: 2}", "{x: 1, y: 5}"), "change mapping");
  EXPECT_EQ(Change("{x: 1}", "{x: 2, fileID: 2}"), "change mapping, mergeable");
  EXPECT_EQ(Change("\n  x: 1", "\n  x: 2"), "change mapping, mergeable");
  const ScopedRules rules("[exclusions]\ninclude *.A.merged\ninclude *.MonoBehaviour");
  EXPECT_EQ(Change("{x: 1}", "{x: 2}", "1.A.merged"), "change mapping, mergeable");
  EXPECT_EQ(Change("\n  m_Script: 1", "\n  m_Script: 2", "7.MonoBehaviour"), "change mapping");
}

const ChangeSequenceOperation* KeyOrder(std::string_view to) {
  FieldPath path = {YAMLScalar::underscore};
  return static_cast<ChangeSequenceOperation*>(
      CreateDiffOperation(path, ValueFromText("[first, a, b, c]").get(), ValueFromText(to).get()));
}

TEST(ApplyDiff, KeysThatTheKeyOrderLacksStayBehindTheirPredecessors) {
  const auto apply = [](const ChangeSequenceOperation* order) {
    const OwnedNode node = ValueFromText("{first: 0, a: 1, b: 2, c: 3}");
    YAMLMappingDiff diff;
    diff.Add(Key("a"), Remove());
    diff.Add(Key("new"), Add("4"));
    diff.SetKeyOrder(order);
    diff.Apply(*node->AsMapping());
    return node->GetYAMLString();
  };
  EXPECT_EQ(apply(nullptr), "{first: 0, b: 2, c: 3, new: 4}");
  EXPECT_EQ(apply(KeyOrder("[new, first, c, b]")), "{new: 4, first: 0, c: 3, b: 2}");
  EXPECT_EQ(apply(KeyOrder("[c, first]")), "{c: 3, first: 0, b: 2, new: 4}");
}

TEST(YAMLSequenceDiff, ShiftsRemapsAndPerformsItsOperations) {
  const std::array ops = {Remove(), Remove(), Add("f")};
  YAMLSequenceDiff diff;
  for (const int i : {0, 1, 3}) diff.Add(i, ops[i == 3 ? 2 : i]);
  EXPECT_THAT(diff.Remap(*KeyOrder("[x, c, first]")->GetRemapper())->GetEntries(),
              testing::ElementsAre(testing::Pair(1, ops[2]), testing::Pair(2, ops[0])));
  const OwnedNode node = ValueFromText("[a, b]");
  diff.Apply(*node->AsSequence());
  EXPECT_THAT(node->AsSequence()->GetItems(), testing::ElementsAre(nullptr, nullptr, nullptr, Key("f")));
  diff.RemoveAndShiftMany({1, 2, 7});
  EXPECT_THAT(diff.GetEntries(), testing::ElementsAre(testing::Pair(0, ops[0]), testing::Pair(1, ops[2])));
}

TEST(MergeTreeVisitors, AnEmptiedCopyLeavesTheOriginalAlone) {
  const OwnedNode from = ValueFromText("{m: {a: 1, gone: 1}, list: [1, {k: v}], v: 0}");
  const OwnedNode to = ValueFromText("{m: {a: 2, n: [x, {y: z}]}, list: [{k: w}, 1], v: [q]}");
  const OwnedNode other(from->Clone());
  FieldPath path;
  auto* original = static_cast<ChangeMappingOperation*>(CreateDiffOperation(path, from.get(), to.get()));
  auto* copy = static_cast<ChangeMappingOperation*>(MergeTreeCloneVisitor::Clone(original));
  MergeTreeClearVisitor clear;
  copy->Accept(clear);
  copy->GetDiff()->Apply(*other->AsMapping());
  EXPECT_EQ(other->GetYAMLString(), "{m: {a: '', n: ['', {y: ''}]}, list: [{k: ''}, 1], v: ['']}");
  original->GetDiff()->Apply(*from->AsMapping());
  EXPECT_EQ(from->GetYAMLString(), "{m: {a: 2, n: [x, {y: z}]}, list: [{k: w}, 1], v: [q]}");
}

TEST(OutputDiff, ShowsEveryKindOfChangeButNoNewOrderOfKeys) {
  const auto from = ObjectsFromText("--- !v!1 &1\nA:\n  name: Gate\n  tag: old\n  list: [a, b, c, d]\n");
  const auto to = ObjectsFromText(
      "--- !v!4 &3 stripped\nB:\n  x: 1\n  y: 2\n--- !v!1 &1\nA:\n  list: [x, d, c]\n  name: \"b\\nc\"\n");
  std::ostringstream text;
  YAMLDiffOutput out(text, 2);
  YAMLMappingDiff::Diff(*from, *to)->Output(out);
  EXPECT_EQ(text.str(),
            "  1 \n      A \n"
            "          name change to 'b\n          \n            c'\n"
            "          tag delete\n          list [4]\n            delete index \"1\"\n"
            "            move index \"1\" to \"2\"\n            move index \"2\" to \"1\"\n"
            "            index 0 add as x\n"
            "  3 add as B:\n             x: 1\n             y: 2\n");
}

}  // namespace
}  // namespace vexel_yaml
