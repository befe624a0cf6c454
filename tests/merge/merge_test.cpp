#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sstream>

#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"
#include "merge/conflict_record_file.h"
#include "merge/exception_conflict_resolver.h"
#include "merge/side_picking_conflict_resolver.h"
#include "tests/support/yaml_text.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {
namespace {

using Recording = RecordingConflictResolver;

TEST(OperationMerge, RowsOfTheTableAreTriedInOrder) {
  YAMLMappingDiff no_entries;
  YAMLSequenceDiff no_elements;
  const RemoveOperation remove(true);
  const ChangeOperation change(YAMLScalar::one);
  const AddOperation add(YAMLScalar::one, true);
  const ChangeMappingOperation mapping(&no_entries, false);
  const ChangeSequenceOperation sequence(&no_elements, nullptr, false);
  const Operation* const kinds[] = {&remove, &change, &add, &mapping, &sequence};
  // The types of the records; those up to 3 and 11 are two-sided.
  constexpr int kTypes[5][5] = {
      {3, 11, 8, 11, 8}, {9, 2, 6, 6, 6}, {9, 7, 1, 4, 4}, {9, 7, 5, 2, 6}, {9, 7, 5, 7, 2}};
  for (size_t left = 0; left < 5; ++left) {
    for (size_t right = 0; right < 5; ++right) {
      Recording resolver(MergeResolve::kRight);
      const Operation* merged = Operation::Merge(kinds[left], kinds[right], resolver);
      const auto type = static_cast<int>(resolver.GetRecords().at(0).type);
      EXPECT_EQ(type, kTypes[left][right]) << left << " with " << right;
      EXPECT_EQ(merged, kinds[type == 11 || (type > 3 && type % 2 == 1) ? right : left]);
    }
  }
}

Recording Resolver(const std::string& resolutions, MergeResolve default_side = MergeResolve::kBase) {
  Recording resolver(default_side);
  std::istringstream file("Conflict handling:\n" + resolutions);
  InputConflictRecords(file, resolver);
  return resolver;
}

std::unique_ptr<VexelObjects> Merged(const VexelObjects& base, const VexelObjects& left,
                                     const VexelObjects& right, ConflictResolver& resolver) {
  const ScopedRules rules("");
  std::unique_ptr<VexelObjects> merged(base.Clone());
  const auto* left_diff = YAMLMappingDiff::Diff(base, left);
  YAMLMappingDiff::Merge(*left_diff, *YAMLMappingDiff::Diff(base, right), resolver)->Apply(*merged);
  return merged;
}

// Merges the field at 1.C.f; an empty text stands for a version without it. Each side also adds a field of
// its own, so that both edit the object and the merge looks into it.
std::string MergedField(const std::string& base, const std::string& left, const std::string& right,
                        ConflictResolver& resolver) {
  const auto scene = [](const std::string& value, const std::string& other) {
    return ObjectsFromText("--- !v!114 &1\nC:\n  z: 0\n" + (value.empty() ? "" : "  f: " + value + "\n") +
                           other);
  };
  const auto merged = Merged(*scene(base, ""), *scene(left, "  l: 1\n"), *scene(right, "  r: 1\n"), resolver);
  const YAMLNode* field = merged->First()->AsMapping()->First()->AsMapping()->Get(YAMLScalar::Lookup("f"));
  return field == nullptr ? "none" : field->GetYAMLString();
}

std::string MergedList(const std::string& base, const std::string& left, const std::string& right,
                       const std::string& resolutions = "") {
  Recording resolver = Resolver(resolutions);
  return MergedField(base, left, right, resolver);
}

TEST(RecordingResolver, AResolutionGivesThatVersionOfTheField) {
  const std::string cases[][3] = {{"1", "2", "1"},
                                  {"1", "1", "2"},
                                  {"", "2", ""},
                                  {"1", "", "1"},
                                  {"1", "1", ""},
                                  {"[a]", "[a]", "[b]"},
                                  {"\n    p: 1", "\n    p: 2", "\n    p: 1"},
                                  {"1", "2", "3"},
                                  {"", "{a: 1}", "{b: 2}"},
                                  {"1", "", "2"},
                                  {"1", "", ""},
                                  {"[a]", "[a, b]", "[a, c]"},
                                  {"{fileID: 1}", "", "{fileID: 2}"},
                                  {"{x: 1, y: 1}", "{x: 2, y: 1}", "{x: 1, y: 2}"}};
  const std::string words[] = {"base", "LEFT", "right"};
  for (const auto& versions : cases) {
    for (size_t i = 0; i < 3; ++i) {
      const std::string& other = words[(i + 1) % 3];
      Recording resolver =
          Resolver(other + " 1.C.f.*\n" + words[i] + "  *.C.f x\n# " + other + "\n" + other + " *.*.f");
      EXPECT_EQ(MergedField(versions[0], versions[1], versions[2], resolver),
                MergedList(versions[0], versions[i], versions[0]))
          << words[i] << " of " << testing::PrintToString(versions);
      EXPECT_FALSE(resolver.HasPendingConflicts());
    }
  }
}

TEST(ConflictRecords, ErrorsNameTheLine) {
  const std::string unknown = "' (should be left,right or base) specified on line ";
  const std::pair<std::string, std::string> cases[] = {
      {"left", "No handling type (left,right,base) specified on line 2"},
      {"\n#\nleft ", "No property path specified on line 4"},
      {"left a\r\nBreakCycle a.b", "Unknown handling type 'BreakCycle" + unknown + "3"}};
  for (const auto& [text, message] : cases) {
    EXPECT_THAT([&] { Resolver(text); },
                testing::Throws<YAMLError>(testing::Property(&YAMLError::what, message)));
  }
}

TEST(RecordingResolver, ADependencyConflictMarksTheObjectsRecord) {
  const YAMLScalar *object = YAMLScalar::one, *settled = YAMLScalar::Lookup("3");
  Recording resolver = Resolver("base 3");
  EXPECT_TRUE(resolver.OnComponentDependencyConflict({object, nullptr, 1, ConflictType::kLeftRemoves}));
  EXPECT_FALSE(resolver.OnComponentDependencyConflict({nullptr, settled, 1, ConflictType::kRightAdds}));
  EXPECT_TRUE(resolver.OnComponentDependencyConflict({nullptr, object, 1, ConflictType::kRightRemoves}));
  std::ostringstream text;
  OutputConflictRecords(text, resolver, false);
  EXPECT_EQ(text.str(), "Conflicts:\nLeft  1 delete\nRight 1 delete\nConflict handling:\nBase 3\n");
}

TEST(RecordingResolver, AnEmptyPathIsMetByAnEmptyPatternOnly) {
  const AddOperation add(YAMLScalar::one, true);
  const ChangeOperation one(YAMLScalar::one), zero(YAMLScalar::zero);
  Recording resolver(MergeResolve::kBlank);
  resolver.SetResolveMethodForPaths({{PathFromText("*"), MergeResolve::kBase}});
  EXPECT_EQ(resolver.OnValueAdded(&add, ConflictType::kRightAdds), &add);
  const auto* blank = static_cast<const ChangeOperation*>(resolver.OnSameValueChanged(&one, &zero));
  EXPECT_EQ(blank->GetValue(), YAMLScalar::empty);
  resolver.SetResolveMethodForPaths({{{}, MergeResolve::kLeft}});
  EXPECT_EQ(resolver.OnValueAdded(&add, ConflictType::kRightAdds), nullptr);
  resolver.PushPath(YAMLScalar::one);
  EXPECT_EQ(resolver.OnValueAdded(&add, ConflictType::kRightAdds), &add);
}

TEST(OperationEquals, EqualHashesAreConfirmedByContent) {
  const OwnedNode a = ValueFromText("{x: 1}"), b = ValueFromText("{x: 2}"), c = ValueFromText("{x: 1}");
  for (const OwnedNode* node : {&a, &b, &c}) (*node)->SetHash(7);
  EXPECT_FALSE(OperationEquals(AddOperation(a.get(), true), AddOperation(b.get(), true)));
  EXPECT_TRUE(OperationEquals(AddOperation(a.get(), true), AddOperation(c.get(), true)));
  EXPECT_FALSE(OperationEquals(AddOperation(a.get(), true), ChangeOperation(c.get())));
}

// What both sides did at one place, pair by pair, with a resolver's answer.
template <typename Answer>
void ForEachTwoSidedPair(ConflictResolver& resolver, Answer answer) {
  YAMLMappingDiff no_entries;
  YAMLSequenceDiff no_elements;
  const RemoveOperation remove(true);
  const ChangeOperation change(YAMLScalar::one), change_too(YAMLScalar::zero);
  const AddOperation add(YAMLScalar::one, true), add_too(YAMLScalar::zero, true);
  const ChangeMappingOperation mapping(&no_entries, true), mapping_too(&no_entries, true);
  const ChangeSequenceOperation sequence(&no_elements, nullptr, true),
      sequence_too(&no_elements, nullptr, true);
  const std::pair<const Operation*, const Operation*> pairs[] = {
      {&change, &change_too}, {&remove, &change},       {&remove, &mapping},
      {&add, &add_too},       {&mapping, &mapping_too}, {&sequence, &sequence_too}};
  for (const auto& [left, right] : pairs) {
    answer(left, right, [&, l = left, r = right] { return Operation::Merge(l, r, resolver); });
  }
}

TEST(SidePickingResolver, TakesItsSideAndNoOther) {
  for (const MergeResolve side : {MergeResolve::kLeft, MergeResolve::kRight}) {
    SidePickingConflictResolver resolver(side);
    ForEachTwoSidedPair(resolver, [&](const Operation* left, const Operation* right, const auto& merge) {
      EXPECT_EQ(merge(), side == MergeResolve::kLeft ? left : right);
    });
    const std::string refused =
        "OnComponentDependencyConflict not implemented in SidePickingConflictResolver";
    EXPECT_THAT([&] { resolver.OnComponentDependencyConflict({}); },
                testing::Throws<YAMLError>(testing::Property(&YAMLError::what, refused)));
  }
  EXPECT_THROW(SidePickingConflictResolver(MergeResolve::kBase), YAMLError);
}

TEST(ExceptionResolver, NamesThePlaceOfEveryConflict) {
  ExceptionConflictResolver resolver;
  resolver.PushPath(YAMLScalar::Lookup("1"));
  resolver.PushPath(YAMLScalar::Lookup("a\n"));
  std::vector<std::string> messages;
  ForEachTwoSidedPair(resolver, [&](const Operation*, const Operation*, const auto& merge) {
    try {
      merge();
    } catch (const YAMLError& error) {
      messages.push_back(error.what());
    }
  });
  const std::string path = "1.a\\n";
  EXPECT_THAT(messages,
              testing::ElementsAre(
                  "Conflict for same value changed " + path, "Conflict for removed value changed " + path,
                  "Conflict for removed value changed " + path,
                  testing::StartsWith("Conflict for same value added " + path + " at line "),
                  "Conflict for same mapping changed " + path, "Conflict for same sequence changed " + path));
  const RemoveOperation remove(true);
  EXPECT_EQ(Operation::Merge(&remove, &remove, resolver), &remove);
}

}  // namespace
}  // namespace vexel_yaml
