#include "scene/settle_scene.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sstream>

#include "merge/conflict_record_file.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

using ::testing::ElementsAre;
using ::testing::Field;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

// The game object `id`, whose transform is `id` + 1.
std::string Thing(int id, const std::string& children = "", int father = 0) {
  const std::string object = std::to_string(id), transform = std::to_string(id + 1);
  return "--- !v!1 &" + object + "\nGameObject:\n  m_Component:\n  - component: {fileID: " + transform +
         "}\n--- !v!4 &" + transform + "\nTransform:\n  m_GameObject: {fileID: " + object +
         "}\n  m_Children: [" + children + "]\n  m_Father: {fileID: " + std::to_string(father) + "}\n";
}

std::string Script(int id, const std::string& fields) {
  return "--- !v!114 &" + std::to_string(id) + "\nMonoBehaviour:\n  m_Enabled: 1\n  " + fields + "\n";
}

struct Settled {
  std::unique_ptr<VexelObjects> base, left, right;
  RecordingConflictResolver resolver{MergeResolve::kBase};
  SettledScene scene;

  Settled(const std::string& b, const std::string& l, const std::string& r, const std::string& choices = "")
      : base(ObjectsFromText(b)), left(ObjectsFromText(l)), right(ObjectsFromText(r)) {
    std::istringstream stream("Conflict handling:\n" + choices);
    InputConflictRecords(stream, resolver);
    scene = SettleScene({*base, *left, *right}, resolver, false);
  }

  std::vector<std::string> Pending() const {
    std::vector<std::string> paths;
    for (const auto& record : resolver.GetRecords()) {
      if (record.resolution == MergeResolve::kConflict) paths.push_back(PathToString(record.path));
    }
    return paths;
  }
  bool Has(int id) const { return base->HasKey(YAMLScalar::Lookup(std::to_string(id))); }
};

std::vector<std::string> FaultsOf(const std::string& documents) {
  std::vector<std::string> texts;
  for (const SceneFault& fault : CheckScene(*ObjectsFromText(documents))) {
    texts.push_back(fault.file_id->GetText() + " " + fault.text);
  }
  return texts;
}

TEST(CheckScene, NamesWhatAnEngineCantLoad) {
  const std::string parent = Thing(10, "{fileID: 21}");
  EXPECT_THAT(FaultsOf(parent + Thing(20, "", 11)), IsEmpty());
  EXPECT_THAT(FaultsOf(Thing(10) + Thing(20, "", 11)), ElementsAre("21 is no child in the list of 11"));
  EXPECT_THAT(FaultsOf(parent + Thing(20)), ElementsAre("11 lists the child 21, which is none of it"));
  EXPECT_THAT(FaultsOf(Thing(10, "{fileID: 11}", 11)), ElementsAre("11 hangs below itself"));
  EXPECT_THAT(FaultsOf("--- !v!1 &7\nGameObject: 1\n" + Script(5, "m_GameObject: {fileID: 7}")), IsEmpty());
  EXPECT_THAT(FaultsOf(Script(5, "target: {fileID: 7}")), ElementsAre("5 refers to 7, which isn't there"));
}

TEST(SettleScene, FieldsOfScriptsMayBearTheNamesOfLinks) {
  const std::string node = Script(5, "m_Children: [1]");
  EXPECT_THAT(Settled(node, "", Script(5, "m_Children: [1, 2]")).Pending(), ElementsAre("5"));
  EXPECT_THAT(Settled(node, Script(5, "m_RootOrder: 1"), "").Pending(), ElementsAre("5"));
}

TEST(SettleScene, APartThatMovedUpIsItsOwnConflictAndTheRestFollowsIt) {
  const std::string base = Thing(10, "{fileID: 21}") + Thing(20, "{fileID: 31}", 11) + Thing(30, "", 21);
  // Right moves 20 to the top and leaves 30 with 10; left deletes all of it.
  const std::string right = Thing(10, "{fileID: 31}") + Thing(20) + Thing(30, "", 11);
  EXPECT_THAT(Settled(base, "", right).Pending(), ::testing::Contains("20"));
  const Settled settled(base, "", right, "right 20\nright 10\n");
  EXPECT_THAT(settled.Pending(), IsEmpty());
  EXPECT_TRUE(settled.Has(20) && settled.Has(30));
}

TEST(SettleScene, OfTwoChoicesThatExcludeOneAnotherTheFirstOneStands) {
  const std::string base = Thing(10) + Thing(20) + Thing(30);
  const std::string left = Thing(10, "{fileID: 31}") + Thing(20) + Thing(30, "", 11);
  const std::string right = Thing(20, "{fileID: 31}") + Thing(30, "", 21);
  const Settled settled(base, left, right, "right 10\nleft 31.Transform.m_Father\n");
  EXPECT_THAT(settled.Pending(), ElementsAre("31.Transform.m_Father"));
  EXPECT_FALSE(settled.Has(10));
  EXPECT_THAT(settled.scene.notes,
              ElementsAre(Field(&SceneNote::text, HasSubstr("together with what stands at 10"))));
}

TEST(SettleScene, SomethingCanBeKeptBelowAThingThatStaysAsInBase) {
  const std::string base =
      Thing(10, "{fileID: 21}, {fileID: 31}") + Thing(20, "", 11) + Thing(30, "", 11) + Thing(40);
  const std::string left =
      Thing(10) + Thing(20, "{fileID: 31}", 41) + Thing(30, "", 21) + Thing(40, "{fileID: 21}");
  const std::string choices = "left 30\nright 40\n";
  EXPECT_THAT(Settled(base, left, Thing(10), choices + "left 20\n").Pending(), ElementsAre("40"));
  const Settled settled(base, left, Thing(10), choices + "base 20\n");
  EXPECT_THAT(settled.Pending(), IsEmpty());
  EXPECT_TRUE(settled.Has(20) && settled.Has(30) && !settled.Has(40));
}

TEST(SettleScene, ANewReferenceIsAnEditThoughTheObjectHadAnother) {
  const auto fields = [](const std::string& target) {
    return Script(5, "target: {fileID: " + target + "}\n  lamps:\n  - {fileID: 10}");
  };
  const std::string right = Script(5, "target: {fileID: 0}\n  lamps: []");
  EXPECT_THAT(Settled(fields("0") + Thing(10), fields("10") + Thing(10), right).Pending(), ElementsAre("10"));
  // In another element of the list, and in an element that moved.
  const auto list = [](const std::string& a, const std::string& b) {
    return Script(
        5, "slots:\n  - {name: a, target: {fileID: " + a + "}}\n  - {name: b, target: {fileID: " + b + "}}");
  };
  EXPECT_THAT(Settled(list("10", "0") + Thing(10), list("0", "10") + Thing(10), list("0", "0")).Pending(),
              ElementsAre("10"));
  const std::string swapped =
      Script(5, "slots:\n  - {name: b, target: {fileID: 0}}\n  - {name: a, target: {fileID: 10}}");
  EXPECT_THAT(Settled(list("10", "0") + Thing(10), swapped + Thing(10), "").Pending(), ElementsAre("5"));
}

TEST(CheckMergedScene, AReferenceThatASideLeftBehindIsCleared) {
  const std::string script = Script(5, "target: {fileID: 10}");
  Settled settled(script + Thing(10) + Thing(20), script + Thing(20), script + Thing(10));
  const auto merged = ObjectsFromText(script);
  CheckMergedScene(settled.scene, *merged, *merged, settled.resolver, false);
  EXPECT_THAT(CheckScene(*merged), IsEmpty());
}

}  // namespace
}  // namespace vexel_yaml
