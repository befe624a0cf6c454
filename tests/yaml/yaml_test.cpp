#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <new>
#include <random>
#include <sstream>
#include <thread>

#include "tests/support/yaml_text.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {
namespace {

TEST(YAMLScalar, ThreadsAgreeOnOneScalarAText) {
  std::array<std::vector<const YAMLScalar*>, 4> found;
  {
    std::vector<std::jthread> threads;
    // More texts than a thread remembers.
    for (auto& scalars : found)
      threads.emplace_back([&] {
        for (int i = 0; i < 20'000; ++i) scalars.push_back(YAMLScalar::Lookup(std::to_string(i)));
      });
  }
  for (const auto& scalars : found) EXPECT_TRUE(scalars == found[0]);
}

uint64_t Invert(uint64_t odd) {
  uint64_t inverse = odd;
  for (int i = 0; i < 6; ++i) inverse *= 2 - odd * inverse;
  return inverse;
}

// Texts with one hash in the standard library, in which the second block takes back what the first one did.
TEST(YAMLScalar, TextsMadeToCollideAreInternedQuickly) {
  constexpr uint64_t kFactor = 0xC6A4A7935BD1E995;
  const auto mix = [](uint64_t block) { return ((block * kFactor) ^ ((block * kFactor) >> 47)) * kFactor; };
  const auto unmix = [](uint64_t mixed) {
    mixed *= Invert(kFactor);
    return (mixed ^ (mixed >> 47)) * Invert(kFactor);
  };
  const auto start = std::chrono::steady_clock::now();
  for (uint64_t i = 0; i < 60'000; ++i) {
    const uint64_t blocks[] = {unmix(mix(0) ^ i), unmix(mix(1) ^ (i * kFactor))};
    YAMLScalar::Lookup({reinterpret_cast<const char*>(blocks), sizeof blocks});
  }
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5));
}

// A mapping and its plainest model go through the same edits, ever more additions among the removals, so that
// it gets and loses its index and its gaps again and again.
TEST(YAMLMapping, BehavesLikeAListOfPairs) {
  using Pair = std::pair<const YAMLScalar*, YAMLNode*>;
  std::mt19937 random(5);
  YAMLMapping mapping(false);
  std::vector<Pair> model;
  for (int step = 0; step < 20'000; ++step) {
    const YAMLScalar* const key = YAMLScalar::Lookup(std::to_string(random() % 60));
    const YAMLScalar* const other = YAMLScalar::Lookup(std::to_string(step % 60));
    const auto at = std::ranges::find(model, key, &Pair::first);
    const auto other_at = std::ranges::find(model, other, &Pair::first);
    if (at == model.end()) {
      if (step % 100 >= step / 200) continue;
      model.emplace_back(key, YAMLScalar::LookupValue(std::to_string(step)));
      mapping.Insert(key, model.back().second);
    } else if (step % 100 >= step / 200) {
      ASSERT_EQ(mapping.Steal(key), at->second);
      model.erase(at);
    } else if (step % 2 == 0) {
      mapping.ChangeKey(key, other);
      at->first = other;
      if (other_at != model.end() && other_at != at) {
        at->second = other_at->second;
        model.erase(other_at);
      }
    } else {
      std::ranges::shuffle(model, random);
      std::vector<const YAMLScalar*> order;
      for (const Pair& pair : model) order.push_back(pair.first);
      mapping.Reorder(order);
    }
    std::vector<Pair> content;
    for (const auto& [k, v] : mapping) content.emplace_back(k, mapping.Get(k));
    ASSERT_EQ(content, model) << "step " << step;
  }
}

TEST(YAMLMapping, ARepeatedKeyStartsDuplicateKeyMode) {
  EXPECT_EQ(ValueFromText("{a: [1], b: 2, a: [1]}")->AsMapping()->Size(), 2);
  // Two values with one hash.
  EXPECT_TRUE(ValueFromText("{a: [32.870, 0], a: [35.014, 0]}")->AsMapping()->HasDuplicateKeys());
  const OwnedNode node = ValueFromText("{a: 1, b: 2, a: 3, b: 2}");
  EXPECT_THROW(node->AsMapping()->end(), YAMLError);
  EXPECT_THROW(node->AsMapping()->Size(), YAMLError);
  EXPECT_EQ(node->GetYAMLString(), "{a: 1, b: 2, a: 3, b: 2}");
  EXPECT_EQ(OwnedNode(node->AsMapping()->ToSequence())->GetYAMLString(), "[{a: 1}, {b: 2}, {a: 3}, {b: 2}]");
}

TEST(StructuralHash, OfWhatWasReadIsTheOneRebuilt) {
  const auto objects = ObjectsFromText("--- !v!1 &1 stripped\nA: 1\nB: [1, {x: 1}]\n");
  const uint32_t read = objects->GetHash();
  objects->RebuildHash(false);
  EXPECT_EQ(objects->GetHash(), read);
  EXPECT_NE(ObjectsFromText("--- !v!1 &1\nA: 1\nB: [1, {x: 1}]\n")->GetHash(), read);
  // Both hash to 0, whatever they stand in.
  EXPECT_EQ(ValueFromText("{a: [[]]}")->GetHash(), ValueFromText("{a: [{}]}")->GetHash());
}

TEST(YAMLAlloc, KeepsALimitedNumberOfSpares) {
  std::vector<YAMLMapping*> mappings(700);
  for (YAMLMapping*& mapping : mappings) mapping = YAMLAlloc<YAMLMapping>::create(false);
  for (YAMLMapping* mapping : mappings) mapping->Free();
  EXPECT_EQ(YAMLAlloc<YAMLMapping>::create(false), mappings[300]);
}

struct Fragile {
  explicit Fragile(bool breaks) {
    if (breaks) throw std::bad_alloc();
  }
  void ResetForAlloc() {}
};

TEST(YAMLAlloc, AnObjectThatCannotBeMadeLeavesItsStorage) {
  Fragile* first = YAMLAlloc<Fragile>::create(false);
  EXPECT_THROW(YAMLAlloc<Fragile>::create(true), std::bad_alloc);
  EXPECT_EQ(YAMLAlloc<Fragile>::create(false), first + sizeof(void*));
}

const std::string kHeader = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n";

// The file written again, or the error.
std::string Read(const std::string& text, DocumentCache* cache = nullptr) try {
  VexelObjects objects;
  if (cache == nullptr) {
    ParseYAMLString(text, objects);
  } else {
    ParseYAMLText(FileText(text), objects, *cache);
  }
  std::ostringstream out;
  objects.Output(out);
  return out.str();
} catch (const YAMLError& error) {
  return error.what() + (error.GetHint().empty() ? "" : " | " + error.GetHint());
}

TEST(ReadAndWrite, KeepsOrderStylesAndFraming) {
  const std::string text =
      "%YAML 1.1\n%TAG !v! tag:other.example,2011:\n"
      "--- !v!1001 &100100000 stripped\nPrefab: {}\n--- !v!1 &2\n{}\n"
      "--- !v!1 &-8679921383154817045\nGameObject:\n  z: 1\n  a: {fileID: 0}\n  list:\n  - b: [1, {x: 2}]\n"
      "--- !v!4 &4\nTransform:\n  again: 1\n  again: 2\n";
  EXPECT_EQ(Read(text), text);
  EXPECT_EQ(Read("\xEF\xBB\xBF" + text.substr(0, text.size() - 1)), text);
  EXPECT_EQ(Read(kHeader + "--- !v!1 &1\nA: |-\n  --- !v!9 &9\nB: \"x\n---y\"\n"),
            kHeader + "--- !v!1 &1\nA: '--- !v!9 &9'\nB: x ---y\n");
}

TEST(ReadAndWrite, EmptySlotsAreLeftOutAndPseudoKeysStandLast) {
  const auto objects = ObjectsFromText("--- !v!1 &2\nA: 1\n");
  objects->First()->AsMapping()->Append(YAMLScalar::Lookup("B"), ValueFromText("[1, 2]").release());
  objects->First()->AsMapping()->Get(YAMLScalar::Lookup("B"))->AsSequence()->Set(0, nullptr);
  std::ostringstream out;
  objects->Output(out);
  EXPECT_EQ(out.str(), kHeader + "--- !v!1 &2\nA: 1\nB: [2]\n");
  EXPECT_EQ(objects->First()->GetYAMLString(), "A: 1\nB: [2]\nMERGE_FileID: 2\nMERGE_ClassID: 1");
}

TEST(ReadAndWrite, BrokenTextIsRefusedWithItsPlace) {
  const std::string first = kHeader + "--- !v!1 &1\nA: 1\n";
  EXPECT_EQ(Read(kHeader + "--- !v!1 &1"), "Error locating end of document sequence | see line 3, object 1");
  EXPECT_EQ(Read(first + "--- !v!1 &2\n- 1\n"), "The object is not a mapping | see line 5, object 2");
  EXPECT_EQ(Read(first + "...\nB: 2\n"), "did not find expected <document start> | see line 6, object 1");
  EXPECT_EQ(Read("%YAML 1.1\n# A\n\n--- 1\n"), "The object is not a mapping | see line 4");
  EXPECT_EQ(Read(first + "--- !v!1 &1\nA: 1\n"), first);
  EXPECT_EQ(Read(first + "--- !v!1 &1\nA: 2\n"),
            "Cannot perform this operation on a YAML file with duplicate keys");
  EXPECT_TRUE(Read("\xFF\xFE%YAML").starts_with("YAML file is not UTF-8 encoded"));
  DocumentCache cache;
  for (int reader = 0; reader < 3; ++reader)
    EXPECT_EQ(Read(first + "--- !v!1 &2\n- 1\n--- !v!1 &3\nA: 1\n--- !v!1 &4\nA: }\n", &cache),
              "The object is not a mapping | see line 5, object 2");
  // Two contents with one hash are no copies of one object.
  EXPECT_EQ(Read(first + "--- !v!1 &2\nA: [32.870, 0]\n--- !v!1 &2\nA: [35.014, 0]\n"),
            "Cannot perform this operation on a YAML file with duplicate keys");
}

TEST(ReadAndWrite, WhatCannotBeWrittenIsRefused) {
  const auto refusal = [](VexelObjects& objects) -> std::string {
    std::ostringstream out;
    try {
      objects.Output(out);
    } catch (const YAMLError& error) {
      return error.what() + (" | " + error.GetHint());
    }
    return "";
  };
  EXPECT_EQ(refusal(*ObjectsFromText("--- !v!1 &1\nA: 1\n--- &2\nA: 1\n")),
            "Cannot write an object without class ID or file ID: '2' | see object 2");
  const auto objects = ObjectsFromText("--- !v!1 &3\nA: {list: []}\n");
  YAMLMapping& body = *objects->First()->AsMapping()->First()->AsMapping();
  for (const char* text : {"\xFF", "\xC0\xAF", "\xED\xA0\x80", "\xF4\x90\x80\x80", "a\xE2\x82"}) {
    body.First()->AsSequence()->Append(YAMLScalar::LookupValue(text));
    EXPECT_EQ(refusal(*objects), "Cannot write a value that is not UTF-8 | see object 3");
    body.First()->AsSequence()->ResetForAlloc();
  }
}

TEST(ReadAndWrite, HostileNestingIsRefusedQuickly) {
  const std::string document = kHeader + "--- !v!1 &1\n";
  const std::string deep = "YAML nesting is deeper than 1000 levels | see line 3, object 1";
  std::string chain = document + "A:\n- &a0 []\n";
  std::string bomb = document + "A:\n- &a0 [x]\n";
  for (int i = 1; i < 1500; ++i) {
    const std::string alias = "*a" + std::to_string(i - 1) + ",";
    const std::string start = "- &a" + std::to_string(i) + " [" + alias;
    chain += start + "]\n";
    if (i < 12) bomb += start + alias + alias + alias + alias + "]\n";
  }
  const auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(Read(document + "A: " + std::string(100'000, '[') + "\n"), deep);
  EXPECT_EQ(Read(chain), deep);
  EXPECT_EQ(Read(bomb), "YAML aliases expand to more than 10000000 nodes | see line 3, object 1");
  // Spread over the objects of one file, and with every anchor a long way from its aliases.
  std::string anchors = kHeader, aliases = document + "A:\n";
  for (int i = 0; i < 10'001; ++i) {
    anchors += "--- !v!1 &" + std::to_string(i) + "\nA: [&a x, *a]\n";
    if (i < 10'000) aliases += "- &a" + std::to_string(i) + " x\n";
  }
  for (int i = 0; i < 200'000; ++i) aliases += "- *a9999\n";
  EXPECT_EQ(Read(anchors), "YAML file holds more than 10000 anchors | see line 20003, object 10000");
  EXPECT_EQ(Read(aliases), "YAML aliases refer to too many anchors | see line 3, object 1");
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(30));
  EXPECT_NE(Read(document + "A: " + std::string(999, '[') + std::string(999, ']') + "\n"), deep);
}

TEST(DocumentCache, SharedDocumentsReadAsIfAlone) {
  std::array<std::string, 3> texts = {kHeader, kHeader, "%YAML 1.1\n%TAG !v! tag:x,2011:\n"};
  for (int i = 0; i < 900; ++i) {
    texts[i % 3] +=
        "--- !v!1 &" + std::to_string(i / 3) + (i % 7 == 0 ? " stripped" : "") + "\nA: {x: [1]}\n";
    texts[i % 3] += i / 3 % 50 == 0 ? "c: 1\nc: 2\n" : i / 3 % 60 == 1 ? "? [key]\n: 1\n" : "";
  }
  std::array<VexelObjects, 3> shared;
  DocumentCache cache;
  {
    std::vector<std::jthread> threads;
    for (int i : {0, 1, 2}) threads.emplace_back([&, i] { ParseYAMLText(FileText(texts[i]), shared[i], cache); });
  }
  for (int i : {0, 1, 2}) {
    VexelObjects alone;
    ParseYAMLString(texts[i], alone);
    EXPECT_EQ(shared[i].GetHash(), alone.GetHash());
    EXPECT_EQ(shared[i].GetObjectsWithDuplicateKeys(), alone.GetObjectsWithDuplicateKeys());
    EXPECT_EQ(shared[i].GetSkippedKeys().at(4).line, 505);
  }
}

}  // namespace
}  // namespace vexel_yaml
