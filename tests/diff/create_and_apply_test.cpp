#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <stdexcept>

#include "diff/merge_tree_visitor.h"
#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"
#include "tests/support/yaml_text.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {
namespace {

TEST(CreateAndApply, RulesHoldAtThePathsOfNestedElements) {
  const ScopedRules rules(
      "[arrays]\nset *.A.outer id\nset *.A.outer.*.inner id\n[comparisons]\nfloat *.A.outer.1.size 0.1 0.1");
  YAMLSequence list(false);
  list.Append(
      ValueFromText("[{id: 1, size: 1, inner: [{id: 5}, {id: 6, v: 1}]}, {id: 2, size: 1}]").release());
  const OwnedNode to =
      ValueFromText("[{id: 2, size: 1.05}, {id: 1, size: 1.05, inner: [{id: 6, v: 2}, {id: 5}]}]");
  FieldPath path = PathFromText("1.A.outer");
  CreateDiffOperation(path, list.Get(0), to.get())->Apply(list, 0);
  // An index in a path is the place in the new list.
  EXPECT_EQ(list.Get(0)->GetYAMLString(),
            "[{id: 2, size: 1.05}, {id: 1, size: 1, inner: [{id: 6, v: 2}, {id: 5}]}]");
}

TEST(CreateAndApply, TheTolerancesBorderIsNotTolerated) {
  const ScopedRules rules("[comparisons]\nfloat *.A.half 0.0001 0.5\nfloat *.A.tenth 0.1 0.0001");
  const auto is_equal = [](std::string_view from, std::string_view to, std::string_view at) {
    FieldPath path = PathFromText(at);
    return CreateDiffOperation(path, ValueFromText(from).get(), ValueFromText(to).get()) == nullptr;
  };
  EXPECT_TRUE(is_equal("1", "1.4999", "1.A.half") && is_equal("-100", "-122", "1.A.tenth"));
  for (const auto* to : {"1.5", "0.5"}) EXPECT_FALSE(is_equal("1", to, "1.A.half"));
  for (const auto* to : {"-123", "100"}) EXPECT_FALSE(is_equal("-100", to, "1.A.tenth"));
  EXPECT_FALSE(is_equal("1", "1.4", "1.A.half.below"));
}

// As deep as a file may be, much beside each level, and hashes that are equal at each: made by hand.
TEST(CreateAndApply, AnEditBelowMisleadingHashesIsFoundQuickly) {
  const auto nested = [](const char* text) {
    OwnedNode inner(YAMLScalar::LookupValue(text));
    for (int level = 0; level < 900; ++level) {
      OwnedNode outer = ValueFromText("{list: []}");
      outer->SetHash(7);
      for (int i = 0; i < 2000; ++i)
        outer->AsMapping()->First()->AsSequence()->Append(YAMLScalar::one->AsValue());
      outer->AsMapping()->Append(YAMLScalar::Lookup("in"), inner.release());
      inner = std::move(outer);
    }
    return inner;
  };
  const OwnedNode from = nested("a"), to = nested("b");
  YAMLSequence list(false);
  list.Append(from->Clone());
  const auto start = std::chrono::steady_clock::now();
  EXPECT_TRUE(list.Get(0)->HasSameContent(*from));
  const auto compared = std::chrono::steady_clock::now();
  FieldPath path;
  const Operation* made = CreateDiffOperation(path, from.get(), to.get());
  EXPECT_LT(std::chrono::steady_clock::now() - compared, 60 * (compared - start));
  made->Apply(list, 0);
  EXPECT_TRUE(list.Get(0)->HasSameContent(*to));
}

TEST(Pools, OperationsTakeWhatTheyOwnBackWithThem) {
  std::vector<ChangeSequenceOperation*> operations;
  for (int i = 0; i < 400; ++i) {
    operations.push_back(YAMLAlloc<ChangeSequenceOperation>::create(
        YAMLAlloc<YAMLSequenceDiff>::create(), YAMLAlloc<YAMLSequenceRemapper>::create(1U, 1U), true));
    operations.back()->GetDiff()->Add(0, YAMLAlloc<RemoveOperation>::create(true));
  }
  const size_t diffs = YAMLAlloc<YAMLSequenceDiff>::freed, mappers = YAMLAlloc<YAMLSequenceRemapper>::freed;
  for (auto* operation : operations) YAMLAlloc<ChangeSequenceOperation>::free(operation);
  EXPECT_EQ(YAMLAlloc<YAMLSequenceDiff>::freed - diffs, 400);
  EXPECT_EQ(YAMLAlloc<YAMLSequenceRemapper>::freed - mappers, 400);
  EXPECT_TRUE(YAMLAlloc<YAMLSequenceDiff>::create()->GetEntries().empty());

  auto* diff = YAMLAlloc<YAMLMappingDiff>::create();
  diff->Add(YAMLScalar::one, YAMLAlloc<AddOperation>::create(YAMLScalar::one, true));
  YAMLAlloc<ChangeMappingOperation>::free(YAMLAlloc<ChangeMappingOperation>::create(diff, true));
  EXPECT_FALSE(YAMLAlloc<YAMLMappingDiff>::create()->HasKey(YAMLScalar::one));
  YAMLAlloc<AddOperation>::free(YAMLAlloc<AddOperation>::create(YAMLScalar::one, true));
  YAMLAlloc<ChangeOperation>::free(YAMLAlloc<ChangeOperation>::create(YAMLScalar::one));
  YAMLAlloc<RemoveOperation>::free(YAMLAlloc<RemoveOperation>::create(true));
}

TEST(CreateAndApply, ListsThatCannotBeMatchedNameTheirPath) {
  FieldPath path = PathFromText("12.A");
  try {
    CreateDiffOperation(path, ValueFromText("{list: [a, a, a]}").get(), ValueFromText("{list: [a]}").get());
    ADD_FAILURE();
  } catch (const std::length_error& error) {
    EXPECT_THAT(error.what(), testing::HasSubstr("12.A.list"));
  }
  EXPECT_EQ(path, PathFromText("12.A"));
}

}  // namespace
}  // namespace vexel_yaml
