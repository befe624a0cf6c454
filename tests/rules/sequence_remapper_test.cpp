#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <random>
#include <stdexcept>

#include "tests/support/yaml_text.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {
namespace {

using testing::ElementsAre;

constexpr uint32_t kGone = YAMLSequenceRemapper::kDropped;

struct GiveBack {
  void operator()(YAMLSequenceRemapper* remapper) const { YAMLAlloc<YAMLSequenceRemapper>::free(remapper); }
};
using Remapper = std::unique_ptr<YAMLSequenceRemapper, GiveBack>;

Remapper Match(std::string_view base, std::string_view changed, std::string_view path = "1.A.list") {
  const ScopedRules rules(
      "[arrays]\nset *.Key.list target.fileID id\nset *.Any.list *.fileID\nplain *.Plain.list");
  return Remapper(YAMLSequenceRemapper::FindMapping(PathFromText(path), *ValueFromText(base)->AsSequence(),
                                                    *ValueFromText(changed)->AsSequence()));
}

Remapper MatchById(std::string_view base, std::string_view changed, bool keep_identity) {
  return Remapper(YAMLSequenceRemapper::FindIdMapping({PathFromText("fileID")},
                                                      *ValueFromText(base)->AsSequence(),
                                                      *ValueFromText(changed)->AsSequence(), keep_identity));
}

TEST(FindMapping, ReferencesAreFoundByFileIDAndGuid) {
  const Remapper moved =
      Match("[{fileID: 1}, {fileID: 2}, {fileID: 3}]", "[{fileID: 3}, {fileID: 1}, {fileID: 2}]");
  EXPECT_TRUE(moved->IsSetRemapper());
  EXPECT_THAT(moved->GetMapping(), ElementsAre(1, 2, 0));
  EXPECT_EQ(moved->GetDestinationCount(), 3);

  const Remapper guids = Match("[{fileID: 1}, {fileID: 1, guid: a}, {fileID: 1, guid: b}]",
                               "[{fileID: 1, guid: b, type: 2}, {fileID: 1}]");
  EXPECT_THAT(guids->GetMapping(), ElementsAre(1, kGone, 0));

  EXPECT_EQ(Match("[{fileID: 1, name: old}]", "[{fileID: 1, name: new}]"), nullptr);
}

TEST(FindMapping, RulesNameTheKeys) {
  const Remapper keyed = Match("[{target: {fileID: 1}, id: 12}, {target: {fileID: 11}, id: 2}]",
                               "[{target: {fileID: 11}, id: 2, value: 3}]", "1.Key.list");
  EXPECT_THAT(keyed->GetMapping(), ElementsAre(kGone, 0));
  EXPECT_THAT(Match("[{a: {fileID: 1}}, {b: {fileID: 2}}]", "[{c: {fileID: 2}}]", "1.Any.list")->GetMapping(),
              ElementsAre(kGone, 0));
  EXPECT_FALSE(Match("[{fileID: 1}, {fileID: 2}]", "[{fileID: 2}]", "1.Plain.list")->IsSetRemapper());
  EXPECT_TRUE(Match("[a]", "[a, b]", "_")->IsSetRemapper());
}

TEST(FindMapping, ElementsWithoutAKeyOfTheirOwnAreMatchedByEquality) {
  for (const std::string_view base : {"[{fileID: 1}, {fileID: 1}, {fileID: 2}]",
                                      "[{fileID: 1}, {other: 1}, 5]", "[{fileID: [1]}, {}, []]"}) {
    EXPECT_EQ(Match(base, base), nullptr);
    EXPECT_FALSE(Match(base, "[{fileID: 7}]")->IsSetRemapper());
  }
  EXPECT_THAT(Match("[A, B, C]", "[A, X, C]")->GetMapping(), ElementsAre(0, kGone, 2));
  EXPECT_THAT(Match("[A]", "[A, A]")->GetMapping(), ElementsAre(1));
  EXPECT_THAT([] { Match("[A, A]", "[A]", "12.GameObject.m_Tags"); },
              testing::ThrowsMessage<std::length_error>(
                  testing::StartsWith("Cannot match the elements of the list at 12.GameObject.m_Tags: ")));
}

TEST(FindIdMapping, SkipsWhatHasNoKeyAndKeepsTheFirstOfTwo) {
  const Remapper found = MatchById("[{fileID: 2}, {}, {fileID: 9}, {fileID: 1}]",
                                   "[x, {fileID: 1}, {fileID: 2}, {fileID: 1}]", false);
  EXPECT_TRUE(found->IsSetRemapper());
  EXPECT_THAT(found->GetMapping(), ElementsAre(2, kGone, kGone, 1));
  EXPECT_EQ(MatchById("[{fileID: 1}]", "[{fileID: 1}]", false), nullptr);
  EXPECT_TRUE(MatchById("[{fileID: 1}]", "[{fileID: 1}]", true)->IsIdentity());
}

Remapper MatchByEquality(const OwnedNode& base, const OwnedNode& changed) {
  return Remapper(YAMLSequenceRemapper::FindGenericMapping({}, *base->AsSequence(), *changed->AsSequence()));
}

// Elements of few kinds, so that many are equal: an empty slot is among them and, on demand, a mapping whose
// hash is not computed: comparing keys alone, it would equal every mapping with the same keys.
OwnedNode RandomList(std::mt19937& random, std::string_view begin, bool with_unhashed) {
  OwnedNode list = ValueFromText(begin);
  for (size_t count = random() % 9; count > 0; --count) {
    constexpr const char* kTexts[] = {"a", "b", "{}", "[]", "{k: 1}", "{k: 2}", "", "{k: 3}"};
    const size_t kind = random() % (with_unhashed ? 8 : 7);
    YAMLNode* element = kind == 6 ? nullptr : ValueFromText(kTexts[kind]).release();
    if (kind == 7) element->SetHash(0);
    list->AsSequence()->Append(element);
  }
  return list;
}

TEST(FindGenericMapping, PairsWithTheFirstEqualElementThatIsLeft) {
  std::mt19937 random(7);
  for (int round = 0; round < 3000; ++round) {
    const OwnedNode base = RandomList(random, "[start]", round % 2 == 1);
    const OwnedNode changed = RandomList(random, "[other start]", round % 2 == 1);
    // With different elements at both ends everything is in the middle.
    base->AsSequence()->Append(YAMLScalar::LookupValue("end"));
    const auto& from = base->AsSequence()->GetItems();
    const auto& to = changed->AsSequence()->GetItems();

    std::vector<uint32_t> expected(from.size(), kGone);
    std::vector<bool> used(to.size());
    for (size_t i = 0; i < from.size(); ++i) {
      for (size_t j = 0; j < to.size() && expected[i] == kGone; ++j) {
        const bool both_empty = from[i] == nullptr && to[j] == nullptr;
        if (used[j] ||
            (!both_empty && (from[i] == nullptr || to[j] == nullptr || !from[i]->HasSameContent(*to[j]))))
          continue;
        used[j] = true;
        expected[i] = static_cast<uint32_t>(j);
      }
    }
    ASSERT_EQ(MatchByEquality(base, changed)->GetMapping(), expected) << "round " << round;
  }
}

TEST(FindGenericMapping, LongListsOfChangedElementsStayAffordable) {
  const OwnedNode base = ValueFromText("[moved]");
  const OwnedNode changed = ValueFromText("[]");
  // All with one hash, as if made to collide.
  const auto append = [](const OwnedNode& list, int number) {
    auto* element = YAMLAlloc<YAMLMapping>::create(true);
    element->Append(YAMLScalar::fileID, YAMLScalar::LookupValue(IntToString(number)));
    element->SetHash(7);
    list->AsSequence()->Append(element);
  };
  const auto start = std::chrono::steady_clock::now();
  for (int i = 0; i < 100000; ++i) {
    append(base, i);
    append(changed, i + 200000);
  }
  changed->AsSequence()->Append(YAMLScalar::LookupValue("moved"));
  EXPECT_EQ(MatchByEquality(base, changed)->GetMapping()[0], 100000);
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(10));
}

TEST(Apply, MovesElementsAndLeavesSlotsForAdditions) {
  const OwnedNode list = ValueFromText("[{fileID: 1}, {fileID: 2}, {fileID: 3}]");
  Match("[{fileID: 1}, {fileID: 2}, {fileID: 3}]", "[{fileID: 3}, {fileID: 7}, {fileID: 1}]")
      ->Apply(*list->AsSequence());
  EXPECT_EQ(list->AsSequence()->Get(1), nullptr);
  EXPECT_EQ(list->GetYAMLString(), "[{fileID: 3}, {fileID: 1}]");

  YAMLSequenceRemapper shorter(5, 2);
  shorter.Apply(*list->AsSequence());
  EXPECT_THAT(list->AsSequence()->GetItems(), ElementsAre(nullptr, nullptr));
}

TEST(Merge, AdditionsFollowTheElementTheyWereInsertedAfter) {
  const Remapper left = Match("[X, Y]", "[S, X, L]", "_"), right = Match("[X, Y]", "[R, X, Q, Y]", "_");
  YAMLSequenceRemapper *left_out = nullptr, *right_out = nullptr;
  const Remapper kept(YAMLSequenceRemapper::Merge(*left, *right, left_out, right_out, false));
  const Remapper from_left(left_out), from_right(right_out);
  EXPECT_THAT(kept->GetMapping(), ElementsAre(2, 5));
  EXPECT_THAT(from_left->GetMapping(), ElementsAre(0, 2, 3));
  EXPECT_THAT(from_right->GetMapping(), ElementsAre(1, 2, 4, 5));
  EXPECT_EQ(kept->GetDestinationCount(), 6);
  EXPECT_TRUE(kept->IsSetRemapper());

  const Remapper dropped(YAMLSequenceRemapper::Merge(*left, *right, left_out, right_out, true));
  const Remapper from_left_too(left_out), from_right_too(right_out);
  EXPECT_THAT(dropped->GetMapping(), ElementsAre(2, kGone));
  EXPECT_THAT(from_right_too->GetMapping(), ElementsAre(1, 2, 4, kGone));
}

TEST(RemoveDestinations, MovesHigherOnesDown) {
  Remapper remapper = Match("[a, b, c, d]", "[c, x, a, y, b]", "_");
  remapper->RemoveDestinations({1, 3});
  EXPECT_THAT(remapper->GetMapping(), ElementsAre(1, 2, 0, kGone));
  EXPECT_EQ(remapper->GetDestinationCount(), 3);
}

}  // namespace
}  // namespace vexel_yaml
