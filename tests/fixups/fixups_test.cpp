#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sstream>

#include "fixups/duplicate_keys.h"
#include "fixups/file_id_collisions.h"
#include "fixups/post_process.h"
#include "fixups/state_machine_transitions.h"
#include "merge/recording_conflict_resolver.h"
#include "tests/support/yaml_text.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {
namespace {

std::string Written(VexelObjects& objects) {
  std::ostringstream text;
  objects.Output(text);
  return text.str().substr(text.str().find("---"));
}

auto ThrowsError(const std::string& message) {
  return testing::Throws<YAMLError>(testing::Property(&YAMLError::what, message));
}

std::string Object(int file_id, const std::string& name, const std::string& fields = "a: 1") {
  return "--- !v!4 &" + std::to_string(file_id) + "\n" + name + ":\n  " + fields + "\n";
}

std::string Transform(int file_id, int father) {
  return Object(file_id, "Transform", "m_Father: {fileID: " + std::to_string(father) + "}");
}

std::string Renumbered(const std::string& base_text, const std::string& left_text,
                       const std::string& right_text) {
  const auto base = ObjectsFromText(base_text), left = ObjectsFromText(left_text);
  const auto right = ObjectsFromText(right_text);
  ConflictingFileIDs ids =
      CreateConflictingFileIDsRemapper(PreProcess(*base), PreProcess(*left), PreProcess(*right));
  RemapCollidingAddFileIDs(ids, *left, *right);
  const std::string text = Written(*right);
  EXPECT_EQ(right->GetHash(), ObjectsFromText(text)->GetHash());
  return text;
}

TEST(FileIDCollisions, ObjectsOfTwoClassesGetTwoFileIDs) {
  EXPECT_EQ(Renumbered("", Object(5, "A"), Object(5, "A")), Object(5, "A"));
  EXPECT_EQ(Renumbered(Object(5, "A"), Object(5, "A"), Object(5, "B")), Object(5, "B"));
  EXPECT_EQ(Renumbered(Object(6, "A"), Object(5, "A") + Object(7, "A"),
                       Object(5, "B") + Object(9, "C", "a: [{fileID: 5}, {fileID: 5, guid: g}, 5]")),
            Object(8, "B") + Object(9, "C", "a: [{fileID: 8}, {fileID: 5, guid: g}, 5]"));
  // Two collisions can't take one file ID; 0 is the null reference.
  EXPECT_EQ(Renumbered("", Object(5, "A") + Object(6, "A"), Object(5, "B") + Object(6, "B")),
            Object(7, "B") + Object(8, "B"));
  EXPECT_EQ(Renumbered(Object(-1, "A"), Object(-2, "A"), Object(-2, "B")), Object(1, "B"));

  std::string crowd;
  for (int file_id = 6; file_id < 24; ++file_id) crowd += Object(file_id, "A");
  EXPECT_EQ(Renumbered(crowd, Object(5, "A"), Object(5, "B")), Object(24, "B"));
  const std::string message = "Cannot create new fileID for conflicting fileID: ";
  crowd += Object(24, "A");
  EXPECT_THAT([&] { Renumbered(crowd, Object(5, "A"), Object(5, "B")); }, ThrowsError(message + "5"));
  EXPECT_THAT([] { Renumbered("", Object(-2, "A"), Object(-2, "B")); }, ThrowsError(message + "-2"));
}

TEST(StateMachineTransitions, GoThereAndBackWithRepeatedKeys) {
  const std::string machine = Object(
      1, "AnimatorStateMachine", "m_StateMachineTransitions:\n    data:\n      a: 1\n    data:\n      a: 2");
  const auto objects = ObjectsFromText(machine + Object(2, "Other", "m_StateMachineTransitions: 3"));
  const std::string text = Written(*objects);
  RefuseDuplicateKeys(*objects, "scene");
  TransitionsToSequences(*objects);
  EXPECT_THAT(Written(*objects), testing::HasSubstr("\n  - data:\n      a: 2\n"));
  TransitionsToMappings(*objects);
  EXPECT_EQ(Written(*objects), text);

  const auto nested = ObjectsFromText(
      Object(1, "A") + Object(7, "AnimatorStateMachine", "m_StateMachineTransitions: {d: {a: 1, a: 2}}"));
  EXPECT_THAT([&] { RefuseDuplicateKeys(*nested, "my.scene"); },
              ThrowsError("Cannot perform this operation on a YAML file with duplicate keys: "
                          "file 'my.scene', object 7"));
}

// The repaired file, for a merge in which left still had `removed`.
std::string Repaired(const std::string& text, const std::string& removed = "",
                     RecordingConflictResolver resolver = RecordingConflictResolver(MergeResolve::kBase)) {
  const auto merged = ObjectsFromText(text), left = ObjectsFromText(removed);
  PostProcessMergeOnly(*merged, *left, *merged, resolver);
  return Written(*merged);
}

TEST(TransformParents, RemovedOnesAreForgottenAndLoopsBroken) {
  EXPECT_EQ(Repaired(Transform(1, 5) + Transform(2, 6), Transform(5, 0)), Transform(1, 0) + Transform(2, 6));
  // Nobody collected the loop: it is broken at its first transform in the file, not at one that leads there.
  EXPECT_EQ(Repaired(Transform(4, 2) + Transform(3, 1) + Transform(2, 3) + Transform(1, 2)),
            Transform(4, 2) + Transform(3, 0) + Transform(2, 3) + Transform(1, 2));
  const auto prefab = [](const std::string& parent) {
    return Object(8, "Prefab", "m_Modification:\n    m_TransformParent: {fileID: " + parent + "}");
  };
  const std::string instance = Object(2, "Transform", "m_PrefabInstance: {fileID: 8}");
  EXPECT_EQ(Repaired(instance + Transform(1, 2) + prefab("1")), instance + Transform(1, 2) + prefab("0"));

  RecordingConflictResolver resolver(MergeResolve::kBase);
  for (const YAMLScalar* key : PathFromText("2.Transform.m_Father")) resolver.PushPath(key);
  EXPECT_EQ(Repaired(Transform(1, 2) + Transform(2, 1), "", resolver), Transform(1, 2) + Transform(2, 0));
  EXPECT_THAT([&] { Repaired(Transform(2, 5), Transform(5, 0), resolver); },
              testing::ThrowsMessage<std::runtime_error>("Cannot find transform parent for fileID"));
}

TEST(TransformParents, DeepHierarchiesTakeLinearTime) {
  const auto objects = ObjectsFromText(""), one = ObjectsFromText(Transform(1, 0));
  for (int file_id = 1; file_id <= 300000; ++file_id) {
    YAMLMapping* object = one->First()->AsMapping()->Clone();
    object->First()->AsMapping()->First()->AsMapping()->Change(
        YAMLScalar::fileID, YAMLScalar::LookupValue(std::to_string(file_id % 300000 + 1)));
    objects->Insert(YAMLScalar::Lookup(std::to_string(file_id)), object);
  }
  RecordingConflictResolver resolver(MergeResolve::kBase);
  PostProcessMergeOnly(*objects, *objects, *objects, resolver);
  EXPECT_EQ(resolver.GetRecords().size(), 1);
}

}  // namespace
}  // namespace vexel_yaml
