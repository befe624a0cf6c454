#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "report/object_names.h"
#include "report/readable_headers.h"
#include "report/report_command.h"
#include "report/value_text.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

const std::string kHeader = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n";

std::string Object(int class_id, int file_id, const std::string& name, const std::string& fields) {
  return "--- !v!" + std::to_string(class_id) + " &" + std::to_string(file_id) + "\n" + name + ":\n  " +
         fields + "\n";
}

// A game object n, its transform n + 4 and its light n + 8.
std::string Lamp(int n, const std::string& name, int parent, const std::string& light = "m_Range: 1") {
  const auto id = [](int value) { return "{fileID: " + std::to_string(value) + "}"; };
  return Object(1, n, "GameObject", "m_Name: " + name + "\n  m_Component: [{component: " + id(n + 4) + "}]") +
         Object(4, n + 4, "Transform", "m_GameObject: " + id(n) + "\n  m_Father: " + id(parent)) +
         Object(108, n + 8, "Light", "m_GameObject: " + id(n) + "\n  " + light);
}

TEST(ObjectNames, PathsFollowTheHierarchyThroughGapsAndLoops) {
  const std::string instance = Object(1001, 90, "PrefabInstance",
                                      "m_Modification: {m_TransformParent: {fileID: 24}, m_Modifications: "
                                      "[{propertyPath: m_Layer, value: 1},"
                                      " {propertyPath: m_Name, value: Boat}]}") +
                               "--- !v!4 &94 stripped\nTransform: {m_PrefabInstance: {fileID: 90}}\n";
  const auto scene =
      ObjectsFromText(Lamp(10, "Harbour", 0) + Lamp(20, "Pier", 14) + Lamp(30, "A", 44) + Lamp(40, "B", 34) +
                      Lamp(50, "Lost", 999) + instance + Object(1, 60, "GameObject", "m_Name: Bare"));
  ObjectNames names({scene.get()});
  const auto path = [&](int id) { return names.GetPath(YAMLScalar::Lookup(std::to_string(id))); };
  EXPECT_EQ(path(28) + " " + path(34) + " " + path(58), "Harbour/Pier B/A Lost");
  EXPECT_EQ(path(94) + " " + path(60) + path(999), "Harbour/Pier/Boat Bare");
  EXPECT_EQ(names.Describe(YAMLScalar::Lookup("28")), "Light of Harbour/Pier");
}

TEST(ValueText, KeepsTextsOnOneLineAndInUtf8) {
  EXPECT_EQ(OnOneLine("\n a\t\x01 b\xC2\x85\xFF\xED\xA0\x80 "), "a b \uFFFD\uFFFD\uFFFD\uFFFD");
  EXPECT_EQ(Shortened("ab\u00E9cde", 6), "ab...");
}

TEST(ReadableHeaders, OnlyHeaderLinesOfReadableFilesChange) {
  const auto readable = [](const std::string& text) {
    std::ostringstream out;
    WriteWithReadableHeaders(out, text);
    return out.str();
  };
  EXPECT_EQ(readable(kHeader + "--- !v!1 &5 stripped\r\nGameObject:\r\n  m_Name: \"La\\nmp\"\r\n"
                               "--- !v!108 &6\nLight:   {m_GameObject: {fileID: 5}}\n"),
            kHeader +
                "--- GameObject &5 \"La mp\" stripped\r\nGameObject:\r\n  m_Name: \"La\\nmp\"\r\n"
                "--- Light &6 of \"La mp\"\nLight:   {m_GameObject: {fileID: 5}}\n");
  EXPECT_EQ(readable("--- !v!1 &5\n<<<<<<<\n{"), "--- !v!1 &5\n<<<<<<<\n{");
}

// Left takes the lamp to the pier, right the pier to the lamp; both make the lamp brighter.
TEST(Report, ShowsWhatEachSideDidAndNothingOfAFileAsMarkup) {
  const std::string folder = ::testing::TempDir() + "report/";
  std::filesystem::create_directory(folder);
  const std::string pier = kHeader + Lamp(10, "Pier", 0);
  const std::string evil = "m_Intensity: 2\n  <i>: \"<script>alert('1')</script>\\x01&\"";
  std::ofstream(folder + "base") << pier << Lamp(20, "Lamp", 0, "m_Intensity: 1\n  <i>: 1");
  std::ofstream(folder + "left") << pier << Lamp(20, "Lamp", 14, evil);
  std::ofstream(folder + "right") << kHeader << Lamp(10, "Pier", 24)
                                  << Lamp(20, "Lamp", 0, "m_Intensity: 3\n  <i>: 1");
  EXPECT_EQ(RunReport({"-o", folder + "page", "--title", "</title>\xFF", "--rules", "/dev/null",
                       folder + "base", folder + "left", folder + "right"}),
            0);
  const ScopedRules emptied("");
  std::ifstream file(folder + "page");
  const std::string page{std::istreambuf_iterator<char>(file), {}};
  std::filesystem::remove_all(folder);
  const auto row = [&](const std::string& id, const std::string& path) {
    const size_t start = page.find("data-path=\"" + path + "\"", page.find("data-file-id=\"" + id + "\""));
    return page.substr(start, page.find("</tr>", start) - start);
  };
  EXPECT_THAT(
      page,
      AllOf(Not(HasSubstr("<script>alert")), Not(HasSubstr("<i>")), HasSubstr("&lt;/title&gt;\uFFFD"),
            HasSubstr("data-file-id=\"28\" data-sides=\"left right\" data-kinds=\"conflict changed\"")));
  EXPECT_THAT(row("28", "Light.&lt;i&gt;"),
              AllOf(HasSubstr("&lt;script&gt;alert(&#39;1&#39;)&lt;/script&gt;\uFFFD&amp;<"),
                    HasSubstr("from left")));
  EXPECT_THAT(row("28", "Light.m_Intensity"),
              AllOf(HasSubstr(">2<"), HasSubstr(">3<"), HasSubstr(">conflict<")));
  EXPECT_THAT(row("14", "Transform.m_Father"), AllOf(HasSubstr(">conflict<"), HasSubstr(">repaired<")));
  EXPECT_THAT(row("24", "Transform.m_Father"), AllOf(HasSubstr("{fileID: 14} Pier"), HasSubstr("from left")));
}

}  // namespace
}  // namespace vexel_yaml
