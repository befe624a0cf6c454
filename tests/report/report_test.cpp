#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>

#include "report/named_note.h"
#include "report/natural_order.h"
#include "report/object_names.h"
#include "report/readable_headers.h"
#include "report/report_command.h"
#include "report/value_text.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

using ::testing::ElementsAre;
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
  const auto scene = ObjectsFromText(Lamp(10, "Harbour", 0) + Lamp(20, "Pier", 14) + Lamp(30, "A", 44) +
                                     Lamp(40, "B", 34) + Lamp(50, std::string(999, 'x'), 999) + instance +
                                     Object(1, 60, "GameObject", "m_Name: Bare"));
  ObjectNames names({scene.get()});
  const auto path = [&](int id) { return names.GetPath(YAMLScalar::Lookup(std::to_string(id))); };
  EXPECT_EQ(path(28) + " " + path(34) + " " + path(58), "Harbour/Pier B/A " + std::string(97, 'x') + "...");
  EXPECT_EQ(path(94) + " " + path(60) + path(999), "Harbour/Pier/Boat Bare");
  EXPECT_EQ(names.Describe(YAMLScalar::Lookup("28")), "Harbour/Pier > Light");
  EXPECT_EQ(NamedNote("24.Transform.m_Father is pending again: not with what stands at 10, 77 or 1", names),
            "Harbour/Pier > Parent is pending again: not with what stands at Harbour, 77 or 1");
}

TEST(NaturalOrder, CountsAsPeopleDo) {
  std::vector<std::string> names = {"Lamp 1000", "Lamp b",     "Lamp", "Lamp 20",
                                    "Lamp 020",  "Lamp 100/A", "9",    "Lamp 100"};
  std::ranges::sort(names, ComesBefore);
  EXPECT_THAT(names, ElementsAre("9", "Lamp", "Lamp 020", "Lamp 20", "Lamp 100", "Lamp 100/A", "Lamp 1000",
                                 "Lamp b"));
}

TEST(ValueText, KeepsTextsOnOneLineAndInUtf8) {
  EXPECT_EQ(OnOneLine("\n a\t b\u202E\uFEFF\u200D\xC2\x85\xED\xA0\x80 "), "a b \u200D \uFFFD\uFFFD\uFFFD");
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

std::string PageOf(const std::string& base, const std::string& left, const std::string& right,
                   const std::vector<std::string>& options = {}) {
  // A folder for each test, since CTest runs them side by side.
  const std::string test = ::testing::UnitTest::GetInstance()->current_test_info()->name();
  const std::string folder = ::testing::TempDir() + test + "/";
  std::filesystem::create_directory(folder);
  std::ofstream(folder + "base") << kHeader << base;
  std::ofstream(folder + "left") << kHeader << left;
  std::ofstream(folder + "right") << kHeader << right;
  std::vector<std::string> arguments = {"vexel-merge-report", folder + "base", folder + "left", "-o",
                                        folder + "page"};
  arguments.insert(arguments.end(), options.begin(), options.end());
  for (const char* argument : {"--rules", "/dev/null", "--title", "</title>\xFF", "--"})
    arguments.emplace_back(argument);
  arguments.push_back(folder + "right");
  const int status = RunReport(arguments);
  const ScopedRules emptied("");
  std::ifstream file(folder + "page");
  std::string page{std::istreambuf_iterator<char>(file), {}};
  std::filesystem::remove_all(folder);
  EXPECT_EQ(status, 0);
  return page;
}

// The first row of that path in an object: field and note, base, left, right, result and state.
std::string Row(const std::string& page, int id, std::string path) {
  path = "data-path=\"" + path + "\"";
  const size_t start = page.find('>', page.find(path, page.find("id=\"" + std::to_string(id) + "\""))) + 1;
  std::string row = page.substr(start, page.find("</tr>", start) - start);
  for (size_t tag = row.find('<'); tag != std::string::npos; tag = row.find('<')) {
    row.replace(tag, row.find('>', tag) + 1 - tag, row.compare(tag, 3, "</t") == 0 ? "|" : "");
  }
  return row;
}

// Left takes the lamp to the pier, right the pier to the lamp; both make the lamp brighter.
TEST(Report, ShowsWhatEachSideDidAndNothingOfAFileAsMarkup) {
  const std::string pier = Lamp(10, "Pier", 0);
  const std::string evil = "m_Intensity: 2\n  <i>: \"<script>'</script>\\x01&\"";
  const std::string page =
      PageOf(pier + Lamp(20, "Lamp", 0, "m_Intensity: 1\n  <i>: 1"), pier + Lamp(20, "Lamp", 14, evil),
             Lamp(10, "Pier", 24) + Lamp(20, "Lamp", 0, "m_Intensity: 3\n  <i>: 1"));
  EXPECT_THAT(page, AllOf(Not(HasSubstr("<script>'")), Not(HasSubstr("<i>")), HasSubstr("/title&gt;\uFFFD")));
  EXPECT_THAT(page, HasSubstr("\"28\" data-sides=\"left right\" data-kinds=\"conflict changed\""));
  EXPECT_THAT(Row(page, 28, "Light.&lt;i&gt;"), HasSubstr("|&lt;script&gt;&#39;&lt;/script&gt;\uFFFD&amp;|"));
  EXPECT_EQ(Row(page, 28, "Light.m_Intensity"), "m_Intensity|1|2|3|1|conflict28.Light.m_Intensity|");
  EXPECT_THAT(Row(page, 14, "Transform.m_Father"), HasSubstr("|conflict repaired14.Transform.m_Father|"));
  EXPECT_THAT(Row(page, 24, "Transform.m_Father"), HasSubstr("|none|Pier|unchanged|Pier|from left|"));
}

TEST(Report, CallsTheSidesByTheirNames) {
  const auto body = [](const std::string& value) { return Object(114, 1, "MonoBehaviour", "t: " + value); };
  const std::string page =
      PageOf(body("[a, c]"), body("[c, a]"), body("[a, c, d]"), {"--theirs", "Ann, <wide>"});
  EXPECT_THAT(page, AllOf(HasSubstr("<th class=\"left\">Ann, &lt;wide&gt;<small>theirs</small></th>"),
                          HasSubstr("<th class=\"right\">Ours</th>"), Not(HasSubstr(">Left"))));
  EXPECT_THAT(Row(page, 1, "MonoBehaviour.t"),
              AllOf(HasSubstr("Ann, &lt;wide&gt;&#39;s new order was not taken"), HasSubstr("|from ours|")));
}

TEST(Report, ShowsEveryChangeAtItsOwnPlace) {
  const auto body = [](const std::string& fields) { return Object(114, 1, "MonoBehaviour", fields); };
  const auto list = [&](const std::string& text) { return body("m_Things: [{fileID: 2}, " + text + "]"); };
  std::string page = PageOf(list("{fileID: 5, n: 0}"), list("{fileID: 3, n: 1}, {fileID: 5, n: 9}"),
                            list("{fileID: 3, n: 7}, {fileID: 5, n: 0}"));
  EXPECT_THAT(Row(page, 1, "MonoBehaviour.m_Things.1"), HasSubstr("n: 9}|unchanged|{fileID: 5, n: 9}|from"));
  EXPECT_THAT(Row(page, 1, "MonoBehaviour.m_Things.+1.n"), HasSubstr("||added 1|added 7|not there|"));
  page = PageOf(list("{fileID: 5, n: 0}"), list("{fileID: 5, n: 0}, {fileID: 9}"), list("{fileID: 5, n: 8}"));
  EXPECT_THAT(Row(page, 1, "MonoBehaviour.m_Things"), HasSubstr("|changed inside|+ {fileID: 9}|merged|"));
  page = PageOf(body("t: [a, c]\n  x.b: 1\n  x:\n    b: 1"), body("t: [c, a]\n  x.b: 2\n  x:\n    b: 1"),
                body("t: [a, c, d]\n  x.b: 1\n  x:\n    b: 3"));
  EXPECT_THAT(Row(page, 1, "MonoBehaviour.t"), HasSubstr("|new order: c, a|+ d|+ d|from right|"));
  EXPECT_EQ(Row(page, 1, "MonoBehaviour.x.b"), "x.b|1|2|unchanged|2|from left|");
}

TEST(Report, ShowsWhatARecordIsAboutAsOneValue) {
  const auto script = [](const std::string& speed, const std::string& key) {
    return Object(114, 1, "MonoBehaviour", "speeds: [1, " + speed + ", 3]\n  key: {fileID: " + key + "}");
  };
  const std::string keys = Lamp(10, "A", 0) + Lamp(20, "B", 0) + Lamp(30, "C", 0);
  const std::string page =
      PageOf(keys + script("2", "10"), keys + script("5", "20"), keys + script("7", "30"), {"--safe"});
  EXPECT_EQ(Row(page, 1, "MonoBehaviour.speeds.1"), "speeds.1|2|5|7|2|conflict1.MonoBehaviour.speeds.1|");
  EXPECT_THAT(page, Not(HasSubstr("data-path=\"MonoBehaviour.speeds\"")));
  EXPECT_EQ(Row(page, 1, "MonoBehaviour.key"), "key|A|B|C|A|conflict1.MonoBehaviour.key.fileID|");
}

TEST(Report, NamesThingsInEachColumnAsItsVersionDoes) {
  const auto scene = [](const std::string& name, const std::string& key) {
    return Lamp(10, name, 0) + Object(114, 1, "MonoBehaviour", "key: " + key + "\n  keys: [" + key + "]");
  };
  const std::string page =
      PageOf(scene("A", "{fileID: 0}"), scene("A", "{fileID: 10}"), scene("B", "{fileID: 0}"), {"--safe"});
  EXPECT_EQ(Row(page, 1, "MonoBehaviour.key"), "key|none|A|unchanged|B|from left|");
  EXPECT_THAT(Row(page, 1, "MonoBehaviour.keys"), HasSubstr("+ A|unchanged|- none\n+ B|from left|"));
}

TEST(Report, TellsThingsOfOneNameApart) {
  const auto scene = [](const std::string& target, const std::string& list) {
    return Lamp(10, "A", 0) + Lamp(20, "A", 0) + Lamp(30, "B", 0) +
           Object(114, 1, "MonoBehaviour", "key: {fileID: " + target + "}\n  keys: [" + list + "]");
  };
  const auto lamps = [](const std::string& ids) {
    std::string list;
    for (const char id : ids) list += std::string(list.empty() ? "" : ", ") + "{fileID: " + id + "0}";
    return list;
  };
  const std::string page =
      PageOf(scene("10", lamps("123")), scene("20", lamps("213")), scene("30", lamps("132")), {"--safe"});
  EXPECT_THAT(Row(page, 1, "MonoBehaviour.key"), HasSubstr("|A (10)|A (20)|B (30)|"));
  EXPECT_THAT(
      Row(page, 1, "MonoBehaviour.keys"),
      HasSubstr("|A (10)\nA (20)\nB|new order: A (20), A (10), \u2026|new order: \u2026, B, A (20)|"));
}

// Left removes the lamp that right renames, and adds another one to the pier that right removes.
TEST(Report, TellsTheWholeFromItsParts) {
  const std::string pier = Lamp(10, "Pier", 0);
  const std::string page = PageOf(pier + Object(1, 5, "GameObject", "m_Name: Lamp"),
                                  pier + Lamp(20, "New", 14), Object(1, 5, "GameObject", "m_Name: Bulb"));
  EXPECT_THAT(Row(page, 5, ""), HasSubstr("|removed |changed inside|1 fieldm_Name: Lamp|conflict5|"));
  EXPECT_EQ(Row(page, 5, "GameObject.m_Name"), "m_Name|Lamp|removed |Bulb|Lamp|in conflict|");
  EXPECT_THAT(Row(page, 24, ""), HasSubstr("|from left|"));
}

TEST(Report, TakesAwayTogetherWhatWasRemovedTogether) {
  const std::string pier = Lamp(10, "Pier", 0);
  const std::string page =
      PageOf(pier + Lamp(20, "Lamp", 14), pier, pier + Lamp(20, "Lamp", 14, "m_Range: 2"), {"--safe"});
  EXPECT_THAT(Row(page, 20, ""), HasSubstr("|conflict20|"));
  EXPECT_THAT(Row(page, 24, ""),
              AllOf(HasSubstr("Goes with the conflict at Pier/Lamp|"), HasSubstr("|in conflict|")));
}

}  // namespace
}  // namespace vexel_yaml
