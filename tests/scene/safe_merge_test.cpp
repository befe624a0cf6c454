#include "scene/safe_merge.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sstream>

#include "merge/conflict_record_file.h"
#include "scene/deletions.h"
#include "scene/object_links.h"
#include "scene/unmatched_choices.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;

// A game object, whose transform has the next file ID, and a light the one behind.
std::string Lamp(int id, int father = 0, const std::string& children = "", int intensity = 2) {
  const std::string object = std::to_string(id), transform = std::to_string(id + 1);
  const std::string light = std::to_string(id + 2), part = "  m_GameObject: {fileID: " + object + "}\n";
  return "--- !v!1 &" + object + "\nGameObject:\n  m_Component:\n  - component: {fileID: " + transform +
         "}\n  - component: {fileID: " + light + "}\n--- !v!4 &" + transform + "\nTransform:\n" + part +
         "  m_Children: [" + children + "]\n  m_Father: {fileID: " + std::to_string(father) +
         "}\n--- !v!108 &" + light + "\nLight:\n" + part + "  m_Intensity: " + std::to_string(intensity) +
         "\n";
}

std::string Script(const std::string& fields) { return "--- !v!114 &5\nMonoBehaviour:\n" + fields; }

struct SafelyMerged {
  SafelyMerged(const std::string& base, const std::string& left, const std::string& right,
               const std::string& choices = "") {
    ObjectsFromText(base)->CopyTo(documents.base);
    ObjectsFromText(left)->CopyTo(documents.left);
    ObjectsFromText(right)->CopyTo(documents.right);
    std::istringstream stream("Conflict handling:\n" + choices);
    InputConflictRecords(stream, resolver);
    TimerStat silent("", nullptr);
    result = SafeMerge(documents, resolver, {.threads = false}, silent);
  }

  std::vector<std::string> Pending() const {
    std::vector<std::string> paths;
    for (const auto& record : resolver.GetRecords()) {
      if (record.resolution == MergeResolve::kConflict) paths.push_back(PathToString(record.path));
    }
    return paths;
  }

  // What stands in a field of an object's body; "-" for nothing.
  std::string At(const std::string& file_id, const std::string& field) const {
    const YAMLMapping* body = GetBody(result.merged->Get(YAMLScalar::Lookup(file_id)));
    const YAMLNode* value = body == nullptr ? nullptr : body->Get(YAMLScalar::Lookup(field));
    return value == nullptr ? "-" : value->GetYAMLString();
  }
  bool Has(const std::string& file_id) const { return result.merged->HasKey(YAMLScalar::Lookup(file_id)); }

  SceneDocuments documents;
  RecordingConflictResolver resolver{MergeResolve::kBase};
  SafeMergeResult result;
};

// Left deletes the lamp 10 and changes a script with it, right edits the lamp and perhaps the script, too.
// The script's field f, until it is settled and settled left and right.
std::vector<std::string> FieldOf(const std::string& base, const std::string& left, const std::string& right) {
  const std::string other = Lamp(20);
  std::vector<std::string> texts;
  for (const char* choices : {"", "left 10\n", "right 10\n"}) {
    const SafelyMerged merged(Script("  f: " + base + "\n") + Lamp(10) + other,
                              Script("  f: " + left + "\n") + other,
                              Script("  f: " + right + "\n") + Lamp(10, 0, "", 4) + other, choices);
    EXPECT_EQ(merged.Pending().empty(), *choices != '\0') << ::testing::PrintToString(merged.Pending());
    texts.push_back(merged.At("5", "f"));
  }
  return texts;
}

TEST(SafeMerge, ThePlacesOfADeletedThingFollowIt) {
  const std::string lamp = "{fileID: 10}", other = "{fileID: 20}";
  EXPECT_THAT(FieldOf(lamp, "{fileID: 0}", lamp), ElementsAre(lamp, "{fileID: 0}", lamp));
  EXPECT_THAT(
      FieldOf("[" + lamp + ", " + other + "]", "[" + other + "]", "[" + lamp + ", " + other + "]"),
      ElementsAre("[" + lamp + ", " + other + "]", "[" + other + "]", "[" + lamp + ", " + other + "]"));
  // An entry that refers to the lamp with one of its fields, which right edits.
  EXPECT_THAT(FieldOf("[{at: 1, of: " + lamp + "}]", "[]", "[{at: 2, of: " + lamp + "}]"),
              ElementsAre("[{at: 1, of: " + lamp + "}]", "[]", "[{at: 2, of: " + lamp + "}]"));
  // Right puts the lamp into the list a second time.
  EXPECT_THAT(FieldOf("[" + other + "]", "[" + other + "]", "[" + other + ", " + lamp + "]")[1],
              "[" + other + "]");
}

TEST(SafeMerge, ASlotStaysASlotWhateverBecomesOfADeletedThing) {
  const std::string lamp = "{fileID: 10}", other = "{fileID: 20}", none = "{fileID: 0}";
  const auto list = [](const std::string& a, const std::string& b) { return "[" + a + ", " + b + "]"; };
  EXPECT_THAT(FieldOf(list(lamp, other), list(none, other), list(lamp, other)),
              ElementsAre(list(lamp, other), list(none, other), list(lamp, other)));
  EXPECT_THAT(FieldOf(list("{fileID: 5}", other), list("{fileID: 5}", other), list(lamp, other)),
              ElementsAre(list(lamp, other), list("{fileID: 5}", other), list(lamp, other)));
  // What right put in the place of what went with the lamp.
  EXPECT_THAT(FieldOf(lamp, none, other), ::testing::Each(other));
  EXPECT_THAT(FieldOf(list(lamp, other), "[" + other + "]", list("{fileID: 5}", other)),
              ::testing::Each(list("{fileID: 5}", other)));
  EXPECT_THAT(FieldOf(list(lamp, other), list(none, other), list("{fileID: 5}", other)),
              ::testing::Each(list("{fileID: 5}", other)));
  // What left put in beside it doesn't keep the lamp away.
  EXPECT_EQ(FieldOf("[" + lamp + ", " + none + "]", "[{fileID: 5}]", "[" + lamp + ", " + none + "]")[2],
            list(lamp, "{fileID: 5}"));
  // Left filled the slot as well: only as long as the lamp stays is that a conflict.
  const std::string base = Script("  f: [{fileID: 5}]\n") + Lamp(10), right = Script("  f: [{fileID: 10}]\n");
  const SafelyMerged merged(base, Script("  f: [{fileID: 0}]\n"), right + Lamp(10), "left 10\n");
  EXPECT_THAT(merged.Pending(), IsEmpty());
  EXPECT_EQ(merged.At("5", "f"), "[{fileID: 0}]");
}

TEST(SafeMerge, WhatTheDeleterDidElsewhereStays) {
  const std::string lamp = "{fileID: 10}", other = "{fileID: 20}";
  // Another reference in its place, an entry that only mentions the lamp deeper, and an override.
  EXPECT_THAT(FieldOf(lamp, other, lamp), ElementsAre(other, other, other));
  EXPECT_THAT(FieldOf("[{at: {x: {y: " + lamp + "}}}]", "[]", "[{at: {x: {y: " + lamp + "}}}]"),
              ElementsAre("[]", "[]", "[]"));
  const std::string overrides = "[{propertyPath: m_Speed, value: 1, objectReference: " + lamp + "}]";
  EXPECT_THAT(FieldOf(overrides, "[]", overrides), ElementsAre("[]", "[]", "[]"));
}

TEST(SafeMerge, WhatComesBackListsNothingThatIsGone) {
  const std::string script = "--- !v!114 &13\nMonoBehaviour:\n  m_GameObject: {fileID: 10}\n  m_Enabled: 1\n";
  const std::string lists = "  lamps: [{fileID: 20}, {fileID: 30}]\n";
  const std::string base = script + lists + Lamp(20) + Lamp(30);
  const std::string right = script + "  m_Tempo: 3\n" + lists + Lamp(20) + Lamp(30);
  const SafelyMerged merged(base, Lamp(30), right, "right 13\n");
  EXPECT_THAT(merged.Pending(), IsEmpty());
  EXPECT_EQ(merged.At("13", "lamps"), "[{fileID: 30}]");
  EXPECT_EQ(merged.At("13", "m_Tempo"), "3");
}

TEST(SafeMerge, AChoiceForAMoveStandsWhereAnotherOneDissolvedTheCircle) {
  const std::string base = Lamp(10) + Lamp(20) + Lamp(30);
  // 10 below 20 below 30 below 10; each side alone makes no circle.
  const std::string left = Lamp(10, 21) + Lamp(20, 0, "{fileID: 11}") + Lamp(30);
  const std::string right = Lamp(10, 0, "{fileID: 31}") + Lamp(20, 31) + Lamp(30, 11, "{fileID: 21}");
  const SafelyMerged open(base, left, right);
  EXPECT_THAT(open.Pending(), SizeIs(3));
  EXPECT_EQ(open.At("11", "m_Father"), "{fileID: 0}");
  const SafelyMerged chosen(
      base, left, right,
      "left 11.Transform.m_Father\nbase 21.Transform.m_Father\nbase 31.Transform.m_Father\n");
  EXPECT_THAT(chosen.Pending(), IsEmpty());
  EXPECT_EQ(chosen.At("11", "m_Father"), "{fileID: 21}");
  EXPECT_EQ(chosen.At("21", "m_Father"), "{fileID: 0}");
  EXPECT_EQ(chosen.At("31", "m_Father"), "{fileID: 0}");
  EXPECT_EQ(chosen.At("21", "m_Children"), "- {fileID: 11}");
}

TEST(SafeMerge, AComponentIsListedByTheGameObjectThatItNames) {
  std::string loose = Lamp(10);
  loose.replace(loose.rfind("  m_GameObject: {fileID: 10}"), 28, "  m_Note: 1");
  std::string left = Lamp(10, 0, "", 3), right = Lamp(10, 0, "", 2) + Lamp(20);
  const SafelyMerged mended(loose, left, right);
  EXPECT_EQ(mended.At("10", "m_Component"), "- component: {fileID: 11}\n- component: {fileID: 12}");
  EXPECT_EQ(mended.At("12", "m_GameObject"), "{fileID: 10}");
}

TEST(SafeMerge, WhatBothDidAlikeIsTakenAsItIs) {
  const std::string broken = Lamp(10, 99, "{fileID: 98}");
  const SafelyMerged merged(Lamp(10), broken, broken);
  EXPECT_THAT(merged.Pending(), IsEmpty());
  EXPECT_EQ(merged.At("11", "m_Children"), "[{fileID: 98}]");
  // One byte of difference makes two edits of it.
  EXPECT_THAT(SafelyMerged(Lamp(10), Lamp(10, 0, "", 3), Lamp(10, 0, "", 4)).Pending(),
              ElementsAre("12.Light.m_Intensity"));
}

TEST(SafeMerge, FaultsFromBeforeAreNamedButNoConflict) {
  std::string base, edited;
  for (int id = 100; id < 112; ++id) {
    const std::string script =
        "--- !v!114 &" + std::to_string(id) + "\nMonoBehaviour:\n  of: {fileID: 9}\n  n: ";
    base += script + "1\n";
    edited += script + "2\n";
  }
  const SafelyMerged merged(base, edited, base + Lamp(10));
  EXPECT_THAT(merged.Pending(), IsEmpty());
  ASSERT_THAT(merged.result.notes, SizeIs(11));
  EXPECT_EQ(merged.result.notes.front().text,
            "Warning: 100 refers to 9, which isn't there, as before the merge");
  EXPECT_EQ(merged.result.notes.back().text, "Warning: 2 more faults are as before the merge");
  // Right's new reference leads nowhere since left has deleted its object: that is the merge's own fault.
  const SafelyMerged cleared(Script("  of: {fileID: 0}\n") + Lamp(10), Script("  of: {fileID: 0}\n"),
                             Script("  of: {fileID: 12}\n") + Lamp(10), "left 10\n");
  EXPECT_EQ(cleared.At("5", "of"), "{fileID: 0}");
  EXPECT_THAT(cleared.result.notes, IsEmpty());
}

TEST(SafeMerge, ADeletionIsOneConflictHoweverMuchHangsOnIt) {
  const std::string below = Lamp(20, 11, "{fileID: 31}") + Lamp(30, 21);
  const std::string base = Lamp(10, 0, "{fileID: 21}") + below + Lamp(40);
  const std::string edited =
      Lamp(10, 0, "{fileID: 21}", 7) + Lamp(20, 11, "{fileID: 31}", 8) + Lamp(30, 21, "", 9) + Lamp(40);
  EXPECT_THAT(SafelyMerged(base, Lamp(40), edited).Pending(), ElementsAre("10"));
  const SafelyMerged kept(base, Lamp(40), edited, "right 10\n");
  EXPECT_EQ(kept.At("32", "m_Intensity"), "9");
  const SafelyMerged gone(base, Lamp(40), edited, "left 10\n");
  EXPECT_THAT(gone.Pending(), IsEmpty());
  for (const char* id : {"10", "11", "12", "20", "21", "22", "30", "31", "32"})
    EXPECT_FALSE(gone.Has(id)) << id;
  EXPECT_TRUE(gone.Has("42"));
}

TEST(Deletions, ArePutTogetherByWhatSomebodyClickedOn) {
  const auto base =
      ObjectsFromText(Lamp(10, 0, "{fileID: 21}") + Lamp(20, 11) + Lamp(30) +
                      "--- !v!1001 &50\nPrefabInstance:\n  m_Modification:\n    m_TransformParent: "
                      "{fileID: 0}\n--- !v!4 &51 stripped\nTransform:\n  m_PrefabInternal: {fileID: "
                      "50}\n--- !v!104 &60\nRenderSettings:\n  m_Fog: 1\n");
  std::vector<const YAMLScalar*> removed;
  for (const char* id : {"10", "11", "12", "20", "21", "22", "32", "50", "51", "60"}) {
    removed.push_back(YAMLScalar::Lookup(id));
  }
  const Deletions deletions(*base, removed);
  std::vector<std::string> things;
  for (const Deletion& deletion : deletions.Get()) {
    things.push_back(deletion.thing->GetText() + " with " + std::to_string(deletion.objects.size()));
  }
  EXPECT_THAT(things, ElementsAre("10 with 6", "32 with 1", "50 with 2", "60 with 1"));
  EXPECT_EQ(deletions.Find(YAMLScalar::Lookup("22")), deletions.Find(YAMLScalar::Lookup("10")));
  EXPECT_EQ(deletions.Find(YAMLScalar::Lookup("30")), Deletions::kNone);
}

TEST(UnmatchedChoices, AreNamedWithTheNearestPath) {
  const auto named = [](const std::string& choices) {
    const SafelyMerged merged(Lamp(200), Lamp(200, 0, "", 3), Lamp(200, 0, "", 4), choices);
    return DescribeUnmatchedChoices(merged.resolver, *merged.result.merged);
  };
  EXPECT_THAT(named("left 202.Light.m_Intensity\n"), IsEmpty());
  EXPECT_THAT(named("left 7.*\nleft *.*\n"), ElementsAre(HasSubstr("'7.*' matches nothing")));
  EXPECT_THAT(named("left 202.Light.m_Intensty\n"), ElementsAre(HasSubstr("mean '202.Light.m_Intensity'?")));
  EXPECT_THAT(named("left 20O\n"), ElementsAre(HasSubstr("did you mean '20")));
  EXPECT_THAT(named("left 77777777\n"), ElementsAre("Warning: the choice for '77777777' matches nothing"));
  std::string many;
  for (int i = 0; i < 13; ++i) many += "left 9999" + std::to_string(i) + "\n";
  EXPECT_THAT(named(many), ::testing::Contains("Warning: 3 more choices match nothing"));
}

}  // namespace
}  // namespace vexel_yaml
