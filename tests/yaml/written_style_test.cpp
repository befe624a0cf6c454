#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <deque>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "tests/support/edge_documents.h"
#include "yaml/folded_object.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {
namespace {

// What the collections below a node say of themselves.
void Describe(const YAMLNode* node, std::ostream& out) {
  if (const YAMLSequence* sequence = node->AsSequence()) {
    out << "list " << sequence->IsFlow();
    for (const YAMLNode* item : sequence->GetItems()) Describe(item, out);
  } else if (const YAMLMapping* mapping = node->AsMapping()) {
    if (mapping->HasDuplicateKeys()) return;
    out << "mapping " << mapping->IsFlow() << mapping->Size();
    for (const auto& [key, value] : *mapping) Describe(value, out);
  }
  if (node->AsScalar() == nullptr) out << ' ' << node->GetLine();
  out << ' ' << node->GetHash() << '\n';
}

// As it is written, and what its nodes say of themselves.
std::string Describe(VexelObjects& objects) {
  std::ostringstream out;
  objects.Output(out);
  for (const auto& [file_id, object] : objects) {
    out << file_id->GetText() << ' ' << object->AsMapping()->FirstKey()->GetText() << ' ';
    Describe(object, out);
  }
  out << objects.GetObjectsWithDuplicateKeys().size() << ' ' << objects.GetSkippedKeys().size();
  return out.str();
}

const YAMLNode* FileIDOf(const YAMLNode* reference) {
  const YAMLMapping* mapping = reference == nullptr ? nullptr : reference->AsMapping();
  return mapping == nullptr ? nullptr : mapping->Get(YAMLScalar::fileID);
}

// Whether a "fileID" other than "0" stands in an "m_PrefabInternal" anywhere below `node`.
bool RefersToPrefab(const YAMLNode& node) {
  if (const YAMLSequence* sequence = node.AsSequence()) {
    return std::ranges::any_of(sequence->GetItems(),
                               [](const YAMLNode* item) { return RefersToPrefab(*item); });
  }
  if (node.AsMapping() == nullptr) return false;
  for (const auto& [key, value] : *node.AsMapping()) {
    const YAMLNode* id = key == YAMLScalar::mPrefabInternal ? FileIDOf(value) : nullptr;
    if ((id != nullptr && id != YAMLScalar::zero) || RefersToPrefab(*value)) return true;
  }
  return false;
}

// What was found out about an object without reading it must be what its content says.
void CheckFacts(const FoldedObject& folded, const YAMLMapping& object) {
  const YAMLMapping* body = object.First()->AsMapping();
  const YAMLNode* father = body == nullptr ? nullptr : FileIDOf(body->Get(YAMLScalar::mFather));
  EXPECT_TRUE(folded.father == nullptr || folded.father == father) << folded.text;
  EXPECT_TRUE(folded.refers_to_prefab || !RefersToPrefab(object)) << folded.text;
}

bool Holds(const FoldedObject& folded, const char* mark) {
  return folded.text.find(mark) != std::string_view::npos;
}

// Everything there is to be told of a text. With a cache, what can be is folded, and counted.
class Reading {
 public:
  Reading(const std::string& text, DocumentCache* cache) {
    try {
      if (cache == nullptr) {
        ParseYAMLString(text, objects_);
      } else {
        ParseYAMLText(FileText(text), objects_, *cache);
      }
    } catch (const YAMLError& error) {
      error_ = std::string(error.what()) + error.GetHint();
    }
  }

  // Adds the folded objects, and those among them that hold something rarer.
  std::string Tell(std::array<long, 4>& folded_count) try {
    if (!error_.empty()) return error_;
    std::vector<std::pair<const FoldedObject*, const YAMLMapping*>> folded;
    for (const auto& [file_id, object] : objects_) {
      if (GetFolded(object) != nullptr) folded.emplace_back(GetFolded(object), object->AsMapping());
    }
    std::string description = Describe(objects_);
    for (const auto& [facts, object] : folded) CheckFacts(*facts, *object);
    for (const auto& [facts, object] : folded) {
      ++folded_count[0];
      for (size_t kind = 1; const char* mark : {": \"", ": '", "w\n    x"})
        folded_count[kind++] += Holds(*facts, mark);
    }
    return description;
  } catch (const YAMLError& error) {
    return error.what();
  }

 private:
  VexelObjects objects_;
  std::string error_;
};

// Nobody can tell whether objects were folded or read at once, in a file alone or in versions that share
// much.
TEST(WrittenStyle, WhatIsFoldedIsWhatWouldHaveBeenRead) {
  const long count = EdgeDocuments::CountToTry();
  std::array<long, 4> folded = {};
  std::array<long, 4> unfolded = {};
  EdgeDocuments documents(20261122);
  for (long i = 0; i < count; i += 2) {
    const std::string header =
        "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n" + std::string(i % 100 == 0 ? "# note\r\n" : "");
    const std::string first = i == 0   ? "--- !v!1 &1\nTransform:\n%YAML 1.1\n"
                              : i == 2 ? "--- !v!1 &1\n"
                                       : documents.Next();
    const std::string second = documents.Next();
    DocumentCache cache;
    std::deque<Reading> shared;
    std::deque<Reading> alone;
    for (const std::string& text : {first + second, first, second + first, second}) {
      shared.emplace_back(header + text, &cache);
      alone.emplace_back(header + text, nullptr);
    }
    for (size_t version = 0; version < shared.size(); ++version) {
      ASSERT_EQ(shared[version].Tell(folded), alone[version].Tell(unfolded)) << first << second;
    }
  }
  EXPECT_EQ(unfolded[0], 0);
  EXPECT_GT(folded[0], count / 4);
  // Values in quotes of both kinds, and such as go over several lines.
  for (size_t kind = 1; kind < folded.size(); ++kind) EXPECT_GT(folded[kind], 0) << kind;
}

}  // namespace
}  // namespace vexel_yaml
