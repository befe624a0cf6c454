#include "view/choices.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "view/card_order.h"

namespace vexel_yaml {
namespace {

using enum MergeResolve;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;

TEST(Choices, AStepIsUndoneAndRedoneAsAWhole) {
  Choices choices;
  choices.Begin("a", kLeft);
  choices.Begin("a", kRight);
  EXPECT_THAT(choices.Get(), ElementsAre(Pair("a", kLeft)));
  EXPECT_FALSE(choices.CanUndo());
  choices.Choose({{"a", kBase}, {"b", kRight}});
  choices.Choose({{"a", std::nullopt}});
  EXPECT_THAT(choices.Get(), ElementsAre(Pair("b", kRight)));
  choices.Undo();
  EXPECT_THAT(choices.Get(), ElementsAre(Pair("a", kBase), Pair("b", kRight)));
  choices.Undo();
  EXPECT_THAT(choices.Get(), ElementsAre(Pair("a", kLeft)));
  EXPECT_FALSE(choices.CanUndo());
  choices.Redo();
  choices.Redo();
  EXPECT_THAT(choices.Get(), ElementsAre(Pair("b", kRight)));
  EXPECT_FALSE(choices.CanRedo());
}

TEST(Choices, ANewStepTakesThePlaceOfThoseThatWereUndone) {
  Choices choices;
  // Twice the same place in one step: the last one holds, and undoing leads back behind both.
  choices.Choose({{"a", kLeft}, {"a", kRight}});
  EXPECT_THAT(choices.Get(), ElementsAre(Pair("a", kRight)));
  choices.Choose({{"b", kLeft}});
  choices.Undo();
  choices.Choose({{"c", kBase}});
  EXPECT_FALSE(choices.CanRedo());
  choices.Undo();
  choices.Undo();
  EXPECT_THAT(choices.Get(), IsEmpty());
}

ReportCard CardOf(const char* id, std::vector<std::string> fields = {}) {
  ReportCard card;
  card.file_id = YAMLScalar::Lookup(id);
  ReportObject object;
  object.file_id = card.file_id;
  for (const std::string& field : fields) {
    object.rows.push_back({});
    object.rows.back().path = {card.file_id, YAMLScalar::Lookup(field)};
  }
  card.objects.push_back(std::move(object));
  return card;
}

std::vector<std::string> KeysOf(const CardOrder& order) {
  std::vector<std::string> keys;
  for (const YAMLScalar* key : order.GetKeys()) keys.push_back(key->GetText());
  return keys;
}

TEST(CardOrder, WhatWasShownStaysWhereItWas) {
  CardOrder order;
  std::vector<ReportCard> cards = {CardOf("1"), CardOf("2"), CardOf("3", {"a", "b"})};
  order.Arrange(cards);
  // 1 is settled and would go to the end, 4 is new behind 3, and 2 is gone for a while.
  cards = {CardOf("3", {"c", "b", "a"}), CardOf("4"), CardOf("1")};
  order.Arrange(cards);
  EXPECT_THAT(KeysOf(order), ElementsAre("1", "2", "3", "4"));
  std::vector<std::string> fields;
  for (const ReportRow& row : cards[0].objects.front().rows) fields.push_back(row.path.back()->GetText());
  EXPECT_THAT(fields, ElementsAre("a", "b", "c"));
  cards = {CardOf("4"), CardOf("2"), CardOf("1"), CardOf("3")};
  order.Arrange(cards);
  EXPECT_THAT(KeysOf(order), ElementsAre("1", "2", "3", "4"));
}

}  // namespace
}  // namespace vexel_yaml
