#include "fixups/component_dependencies.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>

#include "tests/support/yaml_text.h"
#include "yaml/type_info.h"

namespace vexel_yaml {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

// Class IDs; the type information knows all but the last.
enum Class {
  kCollider = 16,
  kBox,
  kCrate,
  kBody,
  kSensor,
  kBigSensor,
  kCloth,
  kLight,
  kLoop,
  kLoopToo,
  kScript
};

std::string Component(int file_id, Class class_id, const std::string& game_object = "{fileID: 1}") {
  return "--- !v!" + std::to_string(class_id) + " &" + std::to_string(file_id) +
         "\nSome:\n  m_GameObject: " + game_object + "\n";
}

// A game object and its components.
std::string Object(const std::vector<std::pair<int, Class>>& components, int file_id = 1) {
  std::string list, documents;
  for (const auto& [id, class_id] : components) {
    list += "  - component: {fileID: " + std::to_string(id) + "}\n";
    documents += Component(id, class_id, "{fileID: " + std::to_string(file_id) + "}");
  }
  return "--- !v!1 &" + std::to_string(file_id) + "\nGameObject:\n  m_Component:\n" + list + documents;
}

std::string Type(Class id, int base, const std::string& required, const std::string& excluded, int is_multi) {
  return "- {id: " + std::to_string(id) + ", name: n, ismulti: " + std::to_string(is_multi) +
         ", baseid: " + std::to_string(base) + ", requires: '" + required + "', conflicts: '" + excluded +
         "'}\n";
}

void ReadTypes(const std::string& types) {
  GetTypeInfoManager().Read(*ObjectsFromText("--- !v!0 &1\nMergeTypeInfo:" + types));
}

class ComponentDependencies : public testing::Test {
 protected:
  ComponentDependencies() {
    const std::string collider = "10000000", body = "13000000";
    ReadTypes("\n" + Type(kCollider, 0, "", "", 0) + Type(kBox, kCollider, "", "", 0) +
              Type(kCrate, kBox, "", "", 0) + Type(kBody, 0, "", "", 0) + Type(kSensor, 0, collider, "", 0) +
              Type(kBigSensor, kSensor, "", "", 0) + Type(kCloth, 0, "", collider, 1) +
              Type(kLight, 0, "", "", 1) + Type(kLoop, kLoopToo, body, "", 0) +
              Type(kLoopToo, kLoop, "", "", 0));
  }
  ~ComponentDependencies() override { ReadTypes(" []\n"); }

  // The conflicts, such as "Left removes 3". The object stands on the side that the type speaks of.
  static std::vector<std::string> Found(const std::string& merged, const std::string& left,
                                        const std::string& right) {
    std::vector<std::string> found;
    for (const ComponentDependencyConflict& conflict : FindComponentDependencyConflicts(
             *ObjectsFromText(merged), *ObjectsFromText(left), *ObjectsFromText(right))) {
      const bool is_left = IsLeftType(conflict.type);
      EXPECT_EQ(is_left ? conflict.second : conflict.first, nullptr);
      EXPECT_EQ(conflict.count, 1);
      found.push_back(std::string(ConflictTypeText(conflict.type)) + " " +
                      (is_left ? conflict.first : conflict.second)->GetText());
    }
    return found;
  }
};

TEST_F(ComponentDependencies, ARequiredComponentIsMissedWhereOneSideHadIt) {
  const std::string sensor = Object({{2, kSensor}}), none = Object({});
  for (const Class collider : {kCollider, kBox, kCrate}) {
    const std::string had = Object({{2, kSensor}, {3, collider}});
    EXPECT_THAT(Found(sensor, had, none), ElementsAre("Right removes 3"));
    EXPECT_THAT(Found(sensor, none, had), ElementsAre("Left removes 3"));
    EXPECT_THAT(Found(sensor, sensor, none), IsEmpty());
    EXPECT_THAT(Found(sensor, had, Object({{4, kBox}})), IsEmpty());
    EXPECT_THAT(Found(Object({{2, kSensor}, {4, collider}}), had, none), IsEmpty());
    // Another game object's collider helps nobody.
    EXPECT_THAT(Found(sensor + Object({{6, collider}}, 5), had, Object({{6, collider}}, 5)),
                ElementsAre("Right removes 3"));
  }
  EXPECT_THAT(Found(sensor, Object({{3, kBody}, {4, kScript}}), none), IsEmpty());
  // A requirement is not inherited.
  EXPECT_THAT(Found(Object({{2, kBigSensor}}), Object({{2, kBigSensor}, {3, kBox}}), none), IsEmpty());
  EXPECT_THAT(Found(Object({{2, kLoop}}), Object({{2, kLoop}, {3, kBody}}), none),
              ElementsAre("Right removes 3"));
}

TEST_F(ComponentDependencies, ComponentsThatExcludeOneAnotherMayNotComeTogether) {
  for (const Class collider : {kCollider, kBox, kCrate}) {
    const std::string cloth = Object({{2, kCloth}}), box = Object({{3, collider}});
    const std::string cloth_first = Object({{2, kCloth}, {3, collider}});
    const std::string box_first = Object({{3, collider}, {2, kCloth}});
    // The later one in the list is the one concerned.
    EXPECT_THAT(Found(cloth_first, cloth, box), ElementsAre("Right adds 3"));
    EXPECT_THAT(Found(cloth_first, box, cloth), ElementsAre("Left adds 3"));
    EXPECT_THAT(Found(box_first, cloth, box), ElementsAre("Left adds 2"));
    // One side had both: the merge is not to blame.
    EXPECT_THAT(Found(cloth_first, box_first, cloth), IsEmpty());
    EXPECT_THAT(Found(cloth_first, box, cloth_first), IsEmpty());
  }
}

TEST_F(ComponentDependencies, OnlySomeClassesMayStandTwiceOnOneObject) {
  const auto doubled = [](Class one, Class other) {
    return Found(Object({{2, one}, {3, other}}), Object({{2, one}}), Object({{3, other}}));
  };
  EXPECT_THAT(doubled(kBody, kBody), ElementsAre("Right adds 3"));
  EXPECT_THAT(doubled(kLight, kLight), IsEmpty());
  EXPECT_THAT(doubled(kScript, kScript), IsEmpty());
  EXPECT_THAT(doubled(kCollider, kBox), IsEmpty());
}

TEST_F(ComponentDependencies, EachConflictIsFoundOnce) {
  EXPECT_THAT(Found(Component(2, kBox) + Component(3, kBody), Object({}), ""),
              ElementsAre("Right removes 1"));
  EXPECT_THAT(
      Found(Object({{2, kSensor}, {3, kSensor}}), Object({{2, kSensor}, {3, kSensor}, {4, kBox}}), ""),
      ElementsAre("Right removes 4"));
  EXPECT_THAT(Found(Object({{2, kBox}, {5, kScript}, {3, kCrate}, {4, kCloth}}),
                    Object({{2, kBox}, {3, kCrate}}), Object({{4, kCloth}})),
              ElementsAre("Right adds 4"));
}

TEST_F(ComponentDependencies, ManyComponentsOfOneObjectStayAffordable) {
  std::vector<std::pair<int, Class>> lights, cloths;
  for (int i = 0; i < 10'000; ++i) {
    lights.emplace_back(10 + 2 * i, i % 2 == 0 ? kLight : kSensor);
    cloths.emplace_back(11 + 2 * i, kCloth);
  }
  auto both = lights;
  both.insert(both.end(), cloths.begin(), cloths.end());
  both.emplace_back(5, kBox);
  const auto merged = ObjectsFromText(Object(both)), left = ObjectsFromText(Object(lights));
  const auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(FindComponentDependencyConflicts(*merged, *left, *ObjectsFromText("")).size(), 1);
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(2));
}

}  // namespace
}  // namespace vexel_yaml
