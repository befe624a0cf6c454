#include "report/typed_value.h"

#include <gtest/gtest.h>

#include "report/value_text.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

using Kind = TypedValue::Kind;

Kind KindOf(std::string_view text) {
  const auto scene = ObjectsFromText("--- !v!1 &10\nGameObject:\n  m_Name: Pier\n");
  ObjectNames names({scene.get()});
  return TypedValueOf(ValueFromText(text).get(), names).kind;
}

TEST(TypedValue, ShowsNothingAsWhatItIsNot) {
  for (const char* number : {"0", "-2.5", "1e-05", ".5", "12345678901234567890"}) {
    EXPECT_EQ(KindOf(number), Kind::kNumber) << number;
  }
  for (const char* text :
       {"007", "1.2.3", "1e", "0x10", "\"\"", "[1, 2]", "{x: 1}", "{x: 1, y: a}", "{x: 1, y: 2, w: 3}",
        "{r: 1, g: 1, b: 1}", "{fileID: 1, other: 2}", "{fileID: [1]}"}) {
    EXPECT_EQ(KindOf(text), Kind::kText) << text;
  }
  EXPECT_EQ(KindOf("{x: 1, y: -2, z: 0.5}"), Kind::kVector);
  EXPECT_EQ(KindOf("{r: 1, g: 0, b: 2.5, a: 1}"), Kind::kColour);
  EXPECT_EQ(KindOf("{fileID: 7, guid: 0123, type: 3}"), Kind::kReference);
}

TEST(TypedValue, NamesWhatAReferenceLeadsTo) {
  const auto scene = ObjectsFromText("--- !v!1 &10\nGameObject:\n  m_Name: Pier\n");
  ObjectNames names({scene.get()});
  names.SetAssetNames({{"0123", "GullSpawner.cs"}, {"4567", "Brick.mat"}});
  EXPECT_EQ(TypedValueOf(ValueFromText("{fileID: 10}").get(), names).name, "Pier");
  EXPECT_EQ(TypedValueOf(ValueFromText("{fileID: 10, guid: 0123}").get(), names).name, "GullSpawner");
  EXPECT_EQ(TypedValueOf(ValueFromText("{fileID: 0}").get(), names).name, "");
  const auto shown = [&](std::string_view text) { return NamedText(ValueFromText(text).get(), names); };
  EXPECT_EQ(shown("[component: {fileID: 10}, {fileID: 0}, {fileID: 7}, \"\"]"),
            "Pier\nnone\n{fileID: 7}\n(empty)");
  EXPECT_EQ(shown("{on: {fileID: 2, guid: 4567, type: 2}, n: [{fileID: 10}]}"), "{on: Brick.mat, n: [Pier]}");
}

TEST(FieldLabel, ReadsAsPeopleWrite) {
  const auto label = [](std::string_view path) { return FieldLabel(PathFromText(path)); };
  EXPECT_EQ(label("1.Transform.m_LocalPosition"), "Local Position");
  EXPECT_EQ(label("1.MonoBehaviour.waves.2.useHDRColor2D"), "Waves \u203A Element 2 \u203A Use HDR Color2D");
  EXPECT_EQ(label("1"), "Whole object");
  EXPECT_EQ(PropertyLabel("m_LocalPosition.y"), "Local Position \u203A Y");
  EXPECT_TRUE(IsSwitch(PathFromText("1.GameObject.m_IsActive")));
  EXPECT_TRUE(IsSwitch(PathFromText("1.Light.m_Enabled")));
  EXPECT_FALSE(IsSwitch(PathFromText("1.Island.m_Island")));
  EXPECT_FALSE(IsSwitch(PathFromText("1.Shop.useCount.enabledIn")));
}

}  // namespace
}  // namespace vexel_yaml
