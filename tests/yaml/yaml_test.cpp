#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <chrono>
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
  const OwnedNode node = ValueFromText("{a: 1, b: 2, a: 3, b: 2}");
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
}

TEST(YAMLAlloc, KeepsALimitedNumberOfSpares) {
  std::vector<YAMLMapping*> mappings(700);
  for (YAMLMapping*& mapping : mappings) mapping = YAMLAlloc<YAMLMapping>::create(false);
  for (YAMLMapping* mapping : mappings) mapping->Free();
  EXPECT_EQ(YAMLAlloc<YAMLMapping>::create(false), mappings[300]);
}

const std::string kHeader = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n";

// The file written again, or the error.
std::string Read(const std::string& text, DocumentCache* cache = nullptr) try {
  VexelObjects objects;
  ParseYAMLString(text, objects, cache);
  std::ostringstream out;
  objects.Output(out);
  return out.str();
} catch (const YAMLError& error) {
  return error.what();
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

TEST(ReadAndWrite, BrokenTextIsRefusedWithItsLine) {
  const std::string first = kHeader + "--- !v!1 &1\nA: 1\n";
  EXPECT_EQ(Read(kHeader + "--- !v!1 &1"), "Error locating end of document sequence");
  EXPECT_EQ(Read(first + "--- !v!1 &2\n- 1\n"), "The object is not a mapping at line 5");
  EXPECT_EQ(Read(first + "...\nB: 2\n"), "did not find expected <document start> at line 6");
  EXPECT_EQ(Read(first + "--- !v!1 &1\nA: 1\n"), first);
  EXPECT_EQ(Read(first + "--- !v!1 &1\nA: 2\n"),
            "Cannot perform this operation on a YAML file with duplicate keys");
  EXPECT_TRUE(Read("\xFF\xFE%YAML").starts_with("YAML file is not UTF-8 encoded"));
  DocumentCache cache;
  for (int reader = 0; reader < 3; ++reader)
    EXPECT_EQ(Read(first + "--- !v!1 &2\n- 1\n--- !v!1 &3\nA: 1\n--- !v!1 &4\nA: }\n", &cache),
              "The object is not a mapping at line 5");
}

TEST(ReadAndWrite, HostileNestingIsRefusedQuickly) {
  const std::string document = kHeader + "--- !v!1 &1\n";
  const std::string deep = "YAML nesting is deeper than 1000 levels at line 3";
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
  EXPECT_EQ(Read(bomb), "YAML aliases expand to more than 10000000 nodes at line 3");
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
    for (int i : {0, 1, 2}) threads.emplace_back([&, i] { ParseYAMLString(texts[i], shared[i], &cache); });
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
