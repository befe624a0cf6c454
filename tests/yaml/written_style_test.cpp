#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <deque>
#include <random>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "yaml/folded_object.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {
namespace {

// A document that lives on the edges of the dialect: mostly as engines write, with everything near it that
// they don't, and at times with a byte changed.
class EdgeDocuments {
 public:
  explicit EdgeDocuments(uint32_t seed) : random_(seed) {}

  std::string Next() {
    text_ = Pick({"--- !v!1 &10\n", "--- !v!4 &-7 stripped\n", "--- !v!114 &8679921383154817045\n",
                  Rarely(40) ? "--- !v!1 &1 \n" : "--- !v!2 &2\n"});
    text_ += Pick({"Transform:\n", "GameObject:\n", "MonoBehaviour:\n"});
    if (Rarely(60)) text_ += Pick({"  # note\n", "...\n", "\n", "Second: 1\n", "- 1\n", "%YAML 1.1\n"});
    Mapping(2);
    for (int i = Rarely(3) ? 1 + Below(2) : 0; i > 0; --i) Mutate();
    return text_;
  }

 private:
  size_t Below(size_t count) { return random_() % count; }
  bool Rarely(size_t times) { return Below(times) == 0; }
  std::string Pick(std::initializer_list<std::string> texts) {
    return *(texts.begin() + Below(texts.size()));
  }

  // One of the lines of `texts`.
  std::string PickLine(const std::string& texts) {
    size_t begin = 0;
    for (size_t i = Below(1 + static_cast<size_t>(std::ranges::count(texts, '\n'))); i > 0; --i) {
      begin = texts.find('\n', begin) + 1;
    }
    return texts.substr(begin, texts.find('\n', begin) - begin);
  }

  std::string Key() {
    if (!Rarely(30))
      return "m_" + std::string(1, static_cast<char>('a' + Below(26))) + std::to_string(Below(4));
    return Rarely(4) ? std::string(127 + Below(3), 'k') + (Rarely(3) ? std::string(896, 'k') : "")
                     : PickLine(
                           "m_Father\nm_PrefabInternal\nMERGE_FileID\na b\na.b\n<n>k\n-\n1\na-\n? k\n'q'\n"
                           "\"q\"\n\n~\n=\n<<\n*a\na#\na:b\n\xC3\xA4");
  }

  std::string Plain() {
    if (!Rarely(4)) return Pick({"0", "1", "-0.5", "1e-05", "Lamp", "Street Lamp", "a/b.c", "Untagged"});
    const std::string wide(60 + Below(24), 'w');
    return Rarely(6)
               ? wide + (Rarely(3) ? "\n    x x" : PickLine("\n x\n xx x"))
               : PickLine(
                     "'a: b'\n'#a'\n'-'\na: b\na :b\na:b\na:\na #b\na#b\n#a\n a\na \na  "
                     "b\n'a'\n\"a\"\nit's\n-\n--\n---\n"
                     "--- a\n-a\n- a\n..\n...\n.5\n?\n? a\n?a\n:a\n&a\n*a\n!a\n!v!1 a\n|\n>\n|-\n%a\n"
                     "@a\n`a\n~\nnull\n=\n<<\na,b\na, b\na]\n[a\n{a\na}\na\tb\n\ta\na\x01\n\xC3\xA4\n"
                     "\xFF\n\x7F\n\xE2\x80\xA8\na\rb\na?b\na&b\n(a)\n$a\na\\n\n1_000\n0x1f\n1:30\n;a\n"
                     "+1\na'b \"c\na\xC2\x85\n%YAML\n\"\\xE9t\\xE9\"\n\"\\u20AC\"\n\"\\xA0\"\n\"\\uD800\"");
  }

  std::string FlowValue() { return Rarely(12) ? Plain() : Pick({"0", "1", "0.5", "-3", "abc", "0f"}); }

  std::string Flow() {
    std::string text = "{fileID: " + Pick({"0", "11", "-5"});
    if (Rarely(3)) return text + "}";
    const bool list = Rarely(4);
    text = list ? "[" : "{";
    const size_t count = Rarely(6) ? Below(14) : Below(4);
    for (size_t i = 0; i < count; ++i) {
      if (i > 0) text += Rarely(40) ? Pick({",", ",  ", " , ", ",\n    "}) : ", ";
      if (!list)
        text += (Rarely(4) ? Key() : std::string(1, static_cast<char>('a' + i))) + (Rarely(50) ? ":" : ": ");
      text += Rarely(30) ? Flow() : FlowValue();
    }
    return text + (Rarely(60) ? "" : list ? "]" : "}");
  }

  std::string Value() {
    if (Rarely(3)) return Flow();
    return Rarely(8) ? Pick({"", "[]", "{}", "[ ]", "{ }", "&x 1", "|\n    text"}) : Plain();
  }

  std::string Indent(size_t column) { return std::string(Rarely(60) ? column + 1 : column, ' '); }

  void Mapping(size_t column) {
    for (size_t i = 1 + Below(Rarely(20) ? 70 : 5); i > 0; --i) {
      text_ += Indent(column);
      Entry(column);
    }
  }

  void Entry(size_t column) {
    text_ += Key() + (Rarely(80) ? Pick({"", " :", "::"}) : ":");
    if (column < 9 && Rarely(5)) {
      text_ += Rarely(20) ? " \n" : "\n";
      if (Rarely(2)) {
        Mapping(column + (Rarely(20) ? 4 : 2));
      } else {
        Sequence(Rarely(20) ? column + 2 : column);
      }
      return;
    }
    const std::string value = Value();
    text_ += (value.empty() && Rarely(2) ? "" : " ") + value +
             (Rarely(60) ? Pick({" \n", "\r\n", " # x\n"}) : "\n");
  }

  void Sequence(size_t column) {
    for (size_t i = 1 + Below(4); i > 0; --i) {
      text_ += Indent(column) + (Rarely(40) ? Pick({"-", "-  ", "-\n", "- - "}) : "- ");
      if (!Rarely(3)) {
        text_ += Value() + "\n";
        continue;
      }
      Entry(column + 2);
      for (size_t more = Below(3); more > 0; --more) {
        text_ += Indent(column + 2);
        Entry(column + 2);
      }
    }
  }

  void Mutate() {
    const size_t at = Below(text_.size());
    static const std::string kBytes = "\n\n :-{}[],'\"#&*!|>%@?\t\r\x01\x7F\xC3~x0";
    switch (Below(4)) {
      case 0:
        text_[at] = kBytes[Below(kBytes.size())];
        return;
      case 1:
        text_.insert(at, 1, kBytes[Below(kBytes.size())]);
        return;
      case 2:
        text_.erase(at, 1 + Below(3));
        return;
      default:
        text_.resize(at + 1);
    }
  }

  std::mt19937 random_;
  std::string text_;
};

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
  const char* wanted = std::getenv("VEXEL_EDGE_DOCUMENTS");
  const long count = wanted == nullptr ? 20'000 : std::atol(wanted);
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
