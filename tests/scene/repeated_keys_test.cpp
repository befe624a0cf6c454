#include "scene/repeated_keys.h"

#include <gtest/gtest.h>

#include <array>
#include <random>
#include <sstream>

#include "yaml/read_yaml.h"

namespace vexel_yaml {
namespace {

// A value in flow style, with keys that repeat, that look as if they were made up, and that tell pairs apart.
std::string RandomValue(std::mt19937& random, int depth) {
  static constexpr std::array kKeys = {"data",      "data",        "first", "'data#2'",
                                       "'data[1]'", "'data[1]#2'", "'*'"};
  const size_t kind = random() % (depth == 0 ? 1 : 4);
  if (kind == 0) return std::to_string(random() % 2);
  std::string text;
  for (size_t pairs = random() % 5; pairs != 0; --pairs) {
    if (!text.empty()) text += ", ";
    if (kind != 1) text += std::string(kKeys[random() % kKeys.size()]) + ": ";
    text += RandomValue(random, depth - 1);
  }
  return kind == 1 ? "[" + text + "]" : "{" + text + "}";
}

void Read(const std::string& text, VexelObjects& objects) {
  DocumentCache cache(true);
  ParseYAMLText(FileText(text), objects, cache);
}

std::string Written(VexelObjects& objects) {
  std::ostringstream out;
  objects.Output(out);
  return out.str();
}

TEST(RepeatedKeys, EveryVersionCanBeCopiedAndIsThenWrittenAsItWas) {
  std::mt19937 random(1);
  size_t repeating = 0;
  for (int round = 0; round < 2000; ++round) {
    std::array<VexelObjects, 3> versions;
    std::array<std::string, 3> texts;
    const std::string path;
    std::vector<FileToRead> files;
    for (size_t i = 0; i < versions.size(); ++i) {
      const std::string text =
          "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n--- !v!1 &1\nA:\n  b: " + RandomValue(random, 4) + "\n";
      VexelObjects unchanged;
      Read(text, unchanged);
      texts[i] = Written(unchanged);
      Read(text, versions[i]);
      repeating += versions[i].GetObjectsWithDuplicateKeys().size();
      files.push_back({"", path, versions[i]});
    }
    RepeatedKeys keys;
    keys.MakeUnique(files);
    for (size_t i = 0; i < versions.size(); ++i) {
      const std::unique_ptr<VexelObjects> copy(versions[i].Clone());
      keys.Restore(*copy);
      EXPECT_EQ(Written(*copy), texts[i]);
    }
  }
  EXPECT_GT(repeating, 1000U);
}

}  // namespace
}  // namespace vexel_yaml
