#include "yaml/write_written_style.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <ranges>
#include <string>
#include <vector>

#include "tests/support/edge_documents.h"
#include "yaml/emit_yaml.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {
namespace {

// Swaps nodes between documents, and takes some away.
class Editor {
 public:
  void Edit(YAMLNode& node) {
    if (YAMLSequence* sequence = node.AsSequence()) {
      for (YAMLNode* item : sequence->SwapItems({})) sequence->Append(Edited(item));
    } else if (YAMLMapping* mapping = node.AsMapping(); mapping != nullptr && !mapping->HasDuplicateKeys()) {
      std::vector<const YAMLScalar*> keys;
      for (const auto& [key, value] : *mapping) keys.push_back(key);
      for (const YAMLScalar* key : keys) {
        if (YAMLNode* value = Edited(mapping->Steal(key))) mapping->Append(key, value);
      }
    }
  }

 private:
  YAMLNode* Edited(YAMLNode* node) {
    OwnedNodePtr<YAMLNode> edited(node);
    if (random_() % 30 == 0) return nullptr;
    if (others_.size() < 300) {
      others_.emplace_back(node->Clone());
    } else if (random_() % 6 == 0) {
      edited.swap(others_[random_() % others_.size()]);
    } else {
      Edit(*edited);
    }
    return edited.release();
  }

  std::mt19937 random_{20261122};
  std::vector<OwnedNodePtr<YAMLNode>> others_;
};

struct Seen {
  long known = 0;
  long broken_lines = 0;

  void Compare(const YAMLNode& node) {
    std::string text;
    if (!WriteInWrittenStyle(node, text)) return;
    ASSERT_EQ(text, EmitWithLibyaml(node));
    ++known;
    broken_lines += std::ranges::any_of(text | std::views::split('\n'),
                                        [](auto line) { return std::ranges::distance(line) > 80; });
  }
};

// Nobody can tell which of the two wrote an object, be it as it was read or edited.
TEST(WrittenStyle, WhatIsWrittenIsWhatLibyamlWouldWrite) {
  const long count = EdgeDocuments::CountToTry();
  EdgeDocuments documents(7);
  Editor editor;
  Seen read;
  Seen edited;
  for (long i = 0; i < count && !testing::Test::HasFatalFailure(); ++i) {
    VexelObjects objects;
    try {
      ParseYAMLString("%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n" + documents.Next(), objects);
    } catch (const YAMLError&) {
      continue;
    }
    for (const auto& [file_id, object] : objects) {
      read.Compare(*object);
      editor.Edit(*object);
      edited.Compare(*object);
    }
  }
  for (const Seen& seen : {read, edited}) {
    EXPECT_GT(seen.known, count / 8);
    EXPECT_GT(seen.broken_lines, count / 100);
  }
}

}  // namespace
}  // namespace vexel_yaml
