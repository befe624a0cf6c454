#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

#include "diff/yaml_mapping_diff.h"
#include "merge/recording_conflict_resolver.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

std::string DefaultRulesText() {
  const std::string here = __FILE__;
  std::ifstream file(here.substr(0, here.rfind("tests/data")) + "data/mergerules.txt");
  EXPECT_TRUE(file);
  return {std::istreambuf_iterator<char>(file), {}};
}

// Merges one value of an object under the default rules. What comes out is the value and, behind it, the
// place of each conflict, below the value; base stands in for what is in conflict.
class DefaultRules : public testing::Test {
 protected:
  static std::string Merged(const std::string& path, const std::string& base, const std::string& left,
                            const std::string& right) {
    const auto base_file = At(path, base), left_file = At(path, left), right_file = At(path, right);
    const auto merged = At(path, base);
    RecordingConflictResolver resolver(MergeResolve::kBase);
    const auto* left_diff = YAMLMappingDiff::Diff(*base_file, *left_file);
    YAMLMappingDiff::Merge(*left_diff, *YAMLMappingDiff::Diff(*base_file, *right_file), resolver)
        ->Apply(*merged);
    std::string result =
        YAMLSequenceRemapper::GetYAMLNodeFieldByPath(merged->First(), PathFromText(path))->GetYAMLString();
    for (const auto& record : resolver.GetRecords()) {
      if (record.resolution != MergeResolve::kConflict) continue;
      result += " conflict at" + PathToString(record.path).substr(path.size() + 2);
    }
    return result;
  }

  // A list in which each side adds one entry alone and both add the one between them.
  static void ExpectPairedAdditions(const std::string& path, const std::string& open,
                                    const std::string& close) {
    const auto list = [&](const std::vector<std::string>& ids) {
      std::string text;
      for (const std::string& id : ids) text += (text.empty() ? "[" : ", ") + open + id + close;
      return text + "]";
    };
    EXPECT_EQ(Merged(path, list({"1", "2"}), list({"1", "2", "4", "5"}), list({"2", "5", "6"})),
              ValueFromText(list({"2", "4", "5", "6"}))->GetYAMLString())
        << path;
  }

 private:
  static std::unique_ptr<VexelObjects> At(const std::string& path, const std::string& value) {
    std::string text = "--- !v!1 &1\n", indent;
    std::vector<std::string> components;
    YAMLSequenceRemapper::Tokenize(path, '.', components);
    for (const std::string& component : components) {
      text += (indent.empty() ? "" : "\n") + indent + component + ":";
      indent += "  ";
    }
    for (const char c : (value.starts_with('\n') ? "" : " ") + value) {
      text += c == '\n' ? "\n" + indent : std::string(1, c);
    }
    auto objects = ObjectsFromText(text + "\n");
    return objects;
  }

  const ScopedRules rules_{DefaultRulesText()};
};

TEST_F(DefaultRules, ComponentsAreToldApartByTheObjectAlone) {
  ExpectPairedAdditions("GameObject.m_Component", "{component: {fileID: ", "}}");
  // The entry's name is no part of it: what right removes is gone under its new name, too.
  EXPECT_EQ(Merged("GameObject.m_Component", "[{4: {fileID: 2}}, {23: {fileID: 3}}]",
                   "[{component: {fileID: 2}}, {component: {fileID: 3}}]", "[{4: {fileID: 2}}]"),
            "[{component: {fileID: 2}}]");
  EXPECT_EQ(Merged("GameObject.m_Component", "[{c: {fileID: 2}}, {c: {fileID: 3}}]",
                   "[{c: {fileID: 3}}, {c: {fileID: 2}}]",
                   "[{c: {fileID: 2}}, {c: {fileID: 3}}, {c: {fileID: 4}}]"),
            "[{c: {fileID: 2}}, {c: {fileID: 3}}, {c: {fileID: 4}}]");
}

TEST_F(DefaultRules, ChildrenOfBothKindsOfTransform) {
  ExpectPairedAdditions("Transform.m_Children", "{fileID: ", "}");
  ExpectPairedAdditions("RectTransform.m_Children", "{fileID: ", "}");
}

TEST_F(DefaultRules, NodesOfAStateMachineAreWhatTheyPlace) {
  ExpectPairedAdditions("AnimatorStateMachine.m_ChildStates",
                        "{m_State: {fileID: ", "}, m_Position: {x: 0}}");
  ExpectPairedAdditions("AnimatorStateMachine.m_ChildStateMachines", "{m_StateMachine: {fileID: ", "}}");
}

TEST_F(DefaultRules, ParametersOfAControllerAreTheirNames) {
  ExpectPairedAdditions("AnimatorController.m_Parameters", "{m_Name: ", "}");
  EXPECT_EQ(Merged("AnimatorController.m_Parameters", "\n- m_Name: Speed\n  m_Type: 1\n  m_DefaultFloat: 0",
                   "\n- m_Name: Jump\n- m_Name: Speed\n  m_Type: 3\n  m_DefaultFloat: 0",
                   "\n- m_Name: Speed\n  m_Type: 1\n  m_DefaultFloat: 5"),
            "- m_Name: Jump\n- m_Name: Speed\n  m_Type: 3\n  m_DefaultFloat: 5");
}

TEST_F(DefaultRules, KeysOfCurvesAndGradientsAreOneConflictUnlessChangedAlike) {
  for (const std::string name : {"m_Curve", "m_ColorKeys", "m_AlphaKeys"}) {
    for (const std::string fields : {"a", "a.b", "a.b.c", "a.b.c.d"}) {
      const std::string path = "MonoBehaviour." + fields + "." + name, base = "[{time: 0}, {time: 1}]";
      const std::string left = "[{time: 0}, {time: 1}, {time: 2}]";
      EXPECT_EQ(Merged(path, base, left, "[{time: 0.5}, {time: 1}]"), base + " conflict at") << path;
      EXPECT_EQ(Merged(path, base, left, left), left);
      EXPECT_TRUE(YAMLSequenceRemapper::ChooseKeyPaths(PathFromText("1." + path)).empty());
    }
  }
}

TEST_F(DefaultRules, VectorsColoursAndReferencesIntoAssetsAreUnits) {
  for (const std::string field : {"a", "a.b", "a.b.c", "a.b.c.d", "a.b.c.d.e"}) {
    const auto merged = [&](const std::string& base, const std::string& left, const std::string& right) {
      return Merged("MonoBehaviour." + field, base, left, right);
    };
    const std::string block = " conflict at";
    EXPECT_EQ(merged("\nx: 1\ny: 1", "\nx: 2\ny: 1", "\nx: 1\ny: 3"), "x: 1\ny: 1" + block) << field;
    EXPECT_EQ(merged("\nr: 1\ng: 1\nb: 1\na: 1", "\nr: 2\ng: 1\nb: 1\na: 1", "\nr: 1\ng: 1\nb: 1\na: 3"),
              "r: 1\ng: 1\nb: 1\na: 1" + block);
    EXPECT_EQ(merged("{fileID: 1, guid: a}", "{fileID: 2, guid: a}", "{fileID: 1, guid: b}"),
              "{fileID: 1, guid: a}" + block);
    // Half of what makes a unit makes none.
    EXPECT_EQ(merged("\nx: 1\nwidth: 1", "\nx: 2\nwidth: 1", "\nx: 1\nwidth: 3"), "x: 2\nwidth: 3");
    EXPECT_EQ(merged("\nr: 1\ng: 1", "\nr: 2\ng: 1", "\nr: 1\ng: 3"), "r: 2\ng: 3");
  }
  // An object's own fields are no vector.
  EXPECT_EQ(Merged("Rect", "\nx: 1\ny: 1", "\nx: 2\ny: 1", "\nx: 1\ny: 3"), "x: 2\ny: 3");
}

TEST_F(DefaultRules, NoiseInPositionsIsNoEdit) {
  // Whether a change of one number from `from` to `to` on the left collides with right's edit beside it.
  const auto is_edit = [](const std::string& field, char number, const std::string& from,
                          const std::string& to) {
    const auto vector = [&](const std::string& value, const std::string& beside) {
      return std::string("{") + number + ": " + value + ", beside: " + beside + "}";
    };
    return Merged(field, vector(from, "0"), vector(to, "0"), vector(from, "8")).ends_with("conflict at");
  };
  for (const std::string field : {"Transform.m_LocalPosition", "RectTransform.m_SizeDelta"}) {
    for (const char number : {'x', 'y', 'z', 'w'}) {
      // Below 5 the absolute tolerance decides, above it the relative one.
      EXPECT_FALSE(is_edit(field, number, "0", "-0.00000099")) << field << number;
      EXPECT_TRUE(is_edit(field, number, "4", "4.0000015")) << field << number;
      EXPECT_FALSE(is_edit(field, number, "1000", "1000.00018"));
      EXPECT_TRUE(is_edit(field, number, "-1000", "-1000.00024"));
      EXPECT_TRUE(is_edit(field, number, "1000", "1000.001"));
    }
  }
  EXPECT_TRUE(is_edit("BoxCollider.m_Size", 'x', "0", "0.0000001"));
}

}  // namespace
}  // namespace vexel_yaml
