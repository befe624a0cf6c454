#include <gtest/gtest.h>

#include <sstream>

#include "tests/support/yaml_text.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {
namespace {

const std::string kHeader = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n";

// An object with `text` as a key, a field, in braces, and in a list, as the file has it.
std::string FileWith(const std::string& text) {
  VexelObjects objects;
  ParseYAMLString(kHeader + "--- !v!1 &1\nA:\n  flow: {}\n  list: []\n", objects);
  YAMLMapping& body = *objects.First()->AsMapping()->First()->AsMapping();
  body.Append(YAMLScalar::Lookup("field"), YAMLScalar::LookupValue(text));
  body.Append(YAMLScalar::Lookup("key of " + text), YAMLScalar::LookupValue("x"));
  body.Get(YAMLScalar::Lookup("flow"))
      ->AsMapping()
      ->Append(YAMLScalar::Lookup("t"), YAMLScalar::LookupValue(text));
  body.Get(YAMLScalar::Lookup("list"))->AsSequence()->Append(YAMLScalar::LookupValue(text));
  std::ostringstream out;
  objects.Output(out);
  return out.str();
}

std::string Rewritten(const std::string& file) {
  VexelObjects objects;
  ParseYAMLString(file, objects);
  std::ostringstream out;
  objects.Output(out);
  return out.str();
}

TEST(Emit, TextsThatAreHardToWriteAreReadBackAsTheyWere) {
  std::string words;
  for (int i = 0; i < 2000; ++i) words += "word" + std::to_string(i) + (i % 7 == 0 ? "  " : " ");
  // clang-format off
  const std::string texts[] = {
      "", " ", "  two leading blanks", "trailing blank ", "a\ttab", "\ttab first", "'", "it's", "\"quoted\"",
      "'both' \"kinds\"", "back\\slash", "a: b", "a:", ": a", ":", "a #b", "#a", "- a", "-", "? a", "?", "a, b", "[",
      "]", "{a: b}", "}", "&anchor", "*alias", "!tag", "|", "> folded", "%TAG", "@", "`", "---", "--- !v!1 &9", "...",
      "null", "~", "true", "No", "0", "-1.5e-07", "0x1F", "1_000", "12:30:45", "2011-01-01", ".inf", "=", "<<", "\n",
      "a\n", "\na", "a\nb", "a\n\nb\n\n", " a\n  b\n", "a\n--- !v!1 &9\nb", "a\r\nb", "\r", "T\u00FCr",
      "\u6249 \U0001F6AA", "\uFEFFmark", "\u0085", "\u2028", "\u00A0", std::string("nul\0in", 6), "\x01\x1B\x7F",
      std::string(5000, 'x'), std::string(300, ' ') + "x", "a" + std::string(300, ' ') + "b", words};
  // clang-format on
  for (const std::string& text : texts) {
    const std::string file = FileWith(text);
    VexelObjects objects;
    ASSERT_NO_THROW(ParseYAMLString(file, objects)) << file;
    ASSERT_EQ(objects.Size(), 1U) << file;
    const YAMLMapping& body = *objects.First()->AsMapping()->First()->AsMapping();
    const auto* value = YAMLScalar::LookupValue(text);
    EXPECT_EQ(body.Get(YAMLScalar::Lookup("field")), value) << file;
    EXPECT_TRUE(body.HasKey(YAMLScalar::Lookup("key of " + text))) << file;
    EXPECT_EQ(body.Get(YAMLScalar::Lookup("flow"))->AsMapping()->First(), value) << file;
    EXPECT_EQ(body.Get(YAMLScalar::Lookup("list"))->AsSequence()->Get(0), value) << file;
    EXPECT_EQ(Rewritten(file), file) << "a second run changes the file once more";
  }
}

TEST(Emit, WhatIsNotUtf8IsRefused) {
  for (const std::string text : {"\xFF", "\xC3", "a\x80z"}) EXPECT_THROW(FileWith(text), YAMLError);
}

}  // namespace
}  // namespace vexel_yaml
