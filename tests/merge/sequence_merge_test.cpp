#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sstream>

#include "diff/yaml_sequence_diff.h"
#include "merge/conflict_record_file.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

// Merges two edits of the list at 1.C.<field>. Its elements are references in `list`, have an "id" of their
// own in `keyed`, and are matched by equality in `plain`.
class SequenceMerging : public testing::Test {
 protected:
  std::string Merged(const std::string& field, const std::string& base, const std::string& left,
                     const std::string& right, const std::string& resolutions = "",
                     bool drop_if_removed_on_either_side = true) {
    const OwnedNode from = ValueFromText(base), to_left = ValueFromText(left),
                    to_right = ValueFromText(right);
    FieldPath path = PathFromText("1.C." + field);
    const auto* left_edit = Edit(path, from, to_left);
    const auto* right_edit = Edit(path, from, to_right);

    RecordingConflictResolver resolver(MergeResolve::kBase);
    std::istringstream file("Conflict handling:\n" + resolutions);
    InputConflictRecords(file, resolver);
    for (const YAMLScalar* key : path) resolver.PushPath(key);
    const auto* merged =
        ChangeSequenceOperation::Merge(*left_edit, *right_edit, resolver, drop_if_removed_on_either_side);
    EXPECT_EQ(resolver.GetPath(), path);

    // The merge must leave both sides' operations as they were: others share them.
    EXPECT_EQ(Applied(*left_edit, base), to_left->GetYAMLString());
    EXPECT_EQ(Applied(*right_edit, base), to_right->GetYAMLString());

    records_.clear();
    for (const auto& record : resolver.GetRecords()) {
      if (record.path.front() == YAMLScalar::underscore) continue;  // The order of an element's keys.
      const bool pending = record.resolution == MergeResolve::kConflict;
      records_.push_back((pending ? "! " : "") + std::string(ConflictTypeText(record.type)) + " " +
                         PathToString(record.path).substr(PathToString(path).size() + 1));
    }
    moves_ = merged->GetRemapper() != nullptr;
    is_lefts_ = merged == left_edit;
    return Applied(*merged, base);
  }

  // What the last merge recorded, such as "Left adds 2", with "! " before what is pending.
  std::vector<std::string> records_;
  bool moves_ = false;
  bool is_lefts_ = false;

 private:
  static const ChangeSequenceOperation* Edit(FieldPath& path, const OwnedNode& from, const OwnedNode& to) {
    return dynamic_cast<const ChangeSequenceOperation*>(CreateDiffOperation(path, from.get(), to.get()));
  }

  // As a field of an object would be changed. No empty slot may stay.
  static std::string Applied(const ChangeSequenceOperation& edit, const std::string& base) {
    const OwnedNode lists = ValueFromText("[" + base + "]");
    edit.Apply(*lists->AsSequence(), 0);
    const YAMLNode* list = lists->AsSequence()->Get(0);
    EXPECT_THAT(list->AsSequence()->GetItems(), testing::Each(testing::NotNull()));
    return list->GetYAMLString();
  }

  const ScopedRules rules_{"[arrays]\nset *.C.keyed id\nplain *.C.plain\n[exclusions]\nexclude *.C.list.*"};
};

TEST_F(SequenceMerging, AdditionsOfBothSidesFollowTheirNeighbours) {
  EXPECT_EQ(Merged("plain", "[a, b]", "[s, a, l, m, b, e]", "[t, a, r, b, f, g]"),
            "[s, t, a, l, m, r, b, e, f, g]");
  EXPECT_THAT(records_, ElementsAre("Left adds 0", "Right adds 1", "Left adds 3", "Left adds 4",
                                    "Right adds 5", "Left adds 7", "Right adds 8", "Right adds 9"));
  // An addition stays behind its neighbour where that has moved, and where it has gone.
  EXPECT_EQ(Merged("keyed", "[{id: 1}, {id: 2}, {id: 3}]", "[{id: 3}, {id: 8}, {id: 1}, {id: 2}]",
                   "[{id: 1}, {id: 2}, {id: 9}, {id: 3}]"),
            "[{id: 1}, {id: 2}, {id: 9}, {id: 3}, {id: 8}]");
  EXPECT_EQ(Merged("plain", "[a, b]", "[b, l]", "[a, r]"), "[r, l]");
}

TEST_F(SequenceMerging, ARemovalWinsOverAnEditUnlessElementsAreToStay) {
  const std::string base = "[{id: 1}, {id: 2}, {id: 3}]", removed = "[{id: 1}, {id: 3}]";
  const std::string edited = "[{id: 1}, {id: 2, v: 5}, {id: 3}, {id: 4}]";
  EXPECT_EQ(Merged("keyed", base, removed, edited), "[{id: 1}, {id: 3}, {id: 4}]");
  EXPECT_THAT(records_, ElementsAre("Right adds 2"));
  EXPECT_EQ(Merged("keyed", base, edited, removed), "[{id: 1}, {id: 3}, {id: 4}]");
  EXPECT_EQ(Merged("keyed", base, removed, edited, "", false), edited);
  EXPECT_THAT(records_, ElementsAre("Right changes 1", "Right adds 3"));
  // A side that moves nothing, against one that removes what it edits.
  const std::string in_place = "[{id: 1, v: 7}, {id: 2, v: 5}, {id: 3}]";
  EXPECT_EQ(Merged("keyed", base, in_place, removed), "[{id: 1, v: 7}, {id: 3}]");
  EXPECT_EQ(Merged("keyed", base, removed, in_place), "[{id: 1, v: 7}, {id: 3}]");
}

TEST_F(SequenceMerging, WhatBothAddedIsOneElementAtLeftsPlace) {
  const std::string base = "[{id: 1}, {id: 2}]";
  // Right's copies are taken out before and between what else right did.
  EXPECT_EQ(Merged("keyed", base, "[{id: 1}, {id: 7}, {id: 8}, {id: 2}]",
                   "[{id: 8}, {id: 9}, {id: 1, v: 3}, {id: 7}, {id: 2, v: 4}]"),
            "[{id: 9}, {id: 1, v: 3}, {id: 7}, {id: 8}, {id: 2, v: 4}]");
  EXPECT_THAT(records_,
              ElementsAre("Both adds 1.id", "Both adds 1", "Both adds 2.id", "Both adds 2", "Right adds 0",
                          "Right changes 1", "Left adds 2", "Left adds 3", "Right changes 4"));
  // Beside an element without a key all are matched by equality, and none is paired.
  EXPECT_EQ(
      Merged("list", "[{fileID: 1}, x]", "[{fileID: 1}, x, {fileID: 3}]", "[{fileID: 3}, {fileID: 1}, x]"),
      "[{fileID: 3}, {fileID: 1}, x, {fileID: 3}]");
}

TEST_F(SequenceMerging, APairThatIsSettledStaysWhateverIsSaidOfLeftsAddition) {
  const std::string base = "[{fileID: 1}, {fileID: 2}]";
  const std::string left = "[{fileID: 1}, {fileID: 7, whole: l}, {fileID: 2}, {fileID: 8}]";
  const std::string right = "[{fileID: 7, whole: r}, {fileID: 1}, {fileID: 2, v: 5}]";
  const auto merged = [&](const std::string& resolutions) {
    return Merged("list", base, left, right, resolutions);
  };
  EXPECT_EQ(merged("right 1.C.list.1"),
            "[{fileID: 1}, {fileID: 7, whole: r}, {fileID: 2, v: 5}, {fileID: 8}]");
  EXPECT_THAT(records_, ElementsAre("Both adds 1", "Left adds 1", "Right changes 2", "Left adds 3"));
  EXPECT_EQ(merged("right 1.C.list.*"), "[{fileID: 1}, {fileID: 7, whole: r}, {fileID: 2, v: 5}]");
}

TEST_F(SequenceMerging, ARefusedAdditionLeavesNoSlotAndARefusedEditItsElement) {
  const std::string base = "[{id: 1}, {id: 2}, {id: 3}]";
  const std::string left = "[{id: 8}, {id: 1, v: 1}, {id: 2}, {id: 3, v: 3}]";
  const std::string right = "[{id: 1}, {id: 9}, {id: 2, v: 2}, {id: 3}, {id: 10}]";
  // The common places: 8, 1, 9, 2, 3, 10.
  const auto merged = [&](const std::string& resolutions) {
    return Merged("keyed", base, left, right, resolutions);
  };
  EXPECT_EQ(merged("base 1.C.keyed.0\nbase 1.C.keyed.2"),
            "[{id: 1, v: 1}, {id: 2, v: 2}, {id: 3, v: 3}, {id: 10}]");
  EXPECT_EQ(merged("base 1.C.keyed.1\nbase 1.C.keyed.5"),
            "[{id: 8}, {id: 1}, {id: 9}, {id: 2, v: 2}, {id: 3, v: 3}]");
  EXPECT_EQ(merged("right 1.C.keyed.*"), "[{id: 1}, {id: 9}, {id: 2, v: 2}, {id: 3}, {id: 10}]");
}

TEST_F(SequenceMerging, TheSameEditOfBothSidesIsMadeOnce) {
  EXPECT_EQ(Merged("list", "[a, b]", "[b, a, x]", "[b, a, x]"), "[b, a, x]");
  EXPECT_TRUE(is_lefts_);
  EXPECT_THAT(records_, IsEmpty());
  // Elements with keys of their own get their records one by one.
  EXPECT_EQ(Merged("keyed", "[{id: 1}]", "[{id: 1}, {id: 2}]", "[{id: 1}, {id: 2}]"), "[{id: 1}, {id: 2}]");
  EXPECT_FALSE(is_lefts_);
  EXPECT_THAT(records_, ElementsAre("Both adds 1.id", "Both adds 1", "Left adds 1"));
}

TEST_F(SequenceMerging, WithoutKeysOrAdditionsTheSameEditIsMergedLikeAnyOther) {
  EXPECT_EQ(Merged("plain", "[a]", "[a, x]", "[a, x]"), "[a, x, x]");
  EXPECT_EQ(Merged("list", "[{fileID: 1}, {fileID: 2}]", "[{fileID: 2}, {fileID: 1}]",
                   "[{fileID: 2}, {fileID: 1}]"),
            "[{fileID: 1}, {fileID: 2}]");
  EXPECT_FALSE(is_lefts_);
  EXPECT_EQ(Merged("list", "[a, b, c]", "[a, c]", "[a, c]"), "[a, c]");
}

TEST_F(SequenceMerging, WhereASideMovesNothingTheOthersLayoutCounts) {
  const std::string base = "[{id: 1, v: 0}, {id: 2, v: 0}, {id: 3}]";
  const std::string edited = "[{id: 1, v: 1}, {id: 2, v: 1}, {id: 3}]";
  const std::string moved = "[{id: 3}, {id: 9}, {id: 2, v: 0}, {id: 1, v: 0}]";
  const std::string both = "[{id: 3}, {id: 9}, {id: 2, v: 1}, {id: 1, v: 1}]";
  EXPECT_EQ(Merged("keyed", base, edited, moved), both);
  EXPECT_THAT(records_, ElementsAre("Right adds 1", "Left changes 2", "Left changes 3"));
  EXPECT_EQ(Merged("keyed", base, moved, edited), both);
  EXPECT_THAT(records_, ElementsAre("Left adds 1", "Right changes 2", "Right changes 3"));

  EXPECT_EQ(Merged("keyed", base, edited, "[{id: 1, v: 0}, {id: 2, v: 2}, {id: 3, w: 3}]"),
            "[{id: 1, v: 1}, {id: 2, v: 0}, {id: 3, w: 3}]");
  EXPECT_THAT(records_, ElementsAre("Left changes 0", "! Both changes 1", "Right changes 2"));
  EXPECT_FALSE(moves_);
  EXPECT_EQ(Merged("keyed", "[]", "[{id: 1}]", "[{id: 2}, {id: 1}]"), "[{id: 1}, {id: 2}]");
  EXPECT_FALSE(moves_);
}

}  // namespace
}  // namespace vexel_yaml
