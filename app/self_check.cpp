#include "app/self_check.h"

#include <iostream>
#include <memory>

#include "app/laws.h"
#include "fixups/duplicate_keys.h"
#include "fixups/three_way_merge.h"
#include "platform/error_channel.h"
#include "rules/yaml_sequence_remapper.h"
#include "yaml/read_yaml.h"

namespace vexel_yaml {

namespace {

constexpr uint32_t kRandomScenes = 500;

// A lamp that one side renames, moves and gives a child, and the other makes flicker with a new component.
constexpr const char* kLamp =
    "--- !v!1 &10\nGameObject:\n  m_Component:\n  - component: {fileID: 11}\n  - component: {fileID: 12}\n"
    "  m_Name: Lamp\n"
    "--- !v!4 &11\nTransform:\n  m_GameObject: {fileID: 10}\n  m_LocalPosition: {x: 0, y: 2.5, z: 0}\n"
    "  m_Children: []\n  m_Father: {fileID: 0}\n"
    "--- !v!108 &12\nLight:\n  m_GameObject: {fileID: 10}\n  m_Intensity: 2\n  m_Range: 10\n";
constexpr const char* kLampMoved =
    "--- !v!1 &10\nGameObject:\n  m_Component:\n  - component: {fileID: 11}\n  - component: {fileID: 12}\n"
    "  m_Name: Street Lamp\n"
    "--- !v!4 &11\nTransform:\n  m_GameObject: {fileID: 10}\n  m_LocalPosition: {x: 0, y: 4, z: 0}\n"
    "  m_Children:\n  - {fileID: 21}\n  m_Father: {fileID: 0}\n"
    "--- !v!108 &12\nLight:\n  m_GameObject: {fileID: 10}\n  m_Intensity: 2\n  m_Range: 40\n"
    "--- !v!4 &21\nTransform:\n  m_Children: []\n  m_Father: {fileID: 11}\n";
constexpr const char* kLampFlickering =
    "--- !v!1 &10\nGameObject:\n  m_Component:\n  - component: {fileID: 11}\n  - component: {fileID: 12}\n"
    "  - component: {fileID: 13}\n  m_Name: Lamp\n"
    "--- !v!4 &11\nTransform:\n  m_GameObject: {fileID: 10}\n  m_LocalPosition: {x: 0, y: 2.5, z: 0}\n"
    "  m_Children: []\n  m_Father: {fileID: 0}\n"
    "--- !v!108 &12\nLight:\n  m_GameObject: {fileID: 10}\n  m_Intensity: 5\n  m_Range: 10\n"
    "--- !v!114 &13\nMonoBehaviour:\n  m_GameObject: {fileID: 10}\n  rhythm:\n  - 0.1\n  - 0.25\n";

std::unique_ptr<VexelObjects> ReadFile(const std::string& path) {
  auto objects = std::make_unique<VexelObjects>();
  ReadYAMLPath(path, *objects);
  ReportSkippedKeys(path, *objects);
  RefuseDuplicateKeys(*objects, path);
  return objects;
}

bool CheckUsersScene(const CommandLineArguments& arguments, Laws& laws) {
  // Nobody knows whether something was moved in the user's scene.
  SceneTriple triple = {ReadFile(arguments[2]), ReadFile(arguments[3]), ReadFile(arguments[4]), true};
  PrepareForDiff(*triple.base, *triple.left, *triple.right);
  const std::string reason = laws.Check(triple);
  if (reason.empty()) return true;
  errs << "These files can't be checked: " << reason << '\n';
  ErrMsg(errs);
  return false;
}

void CheckOwnScenes(Laws& laws) {
  SceneTriple lamp = {ReadScene(kLamp), ReadScene(kLampMoved), ReadScene(kLampFlickering)};
  laws.Check(lamp);
  for (uint32_t seed = 0; seed < kRandomScenes; ++seed) laws.Check(RandomTriple(seed));
}

int PrintResults(const Laws& laws) {
  size_t failed = 0;
  size_t passed_laws = 0;
  for (const Laws::Result& result : laws.GetResults()) {
    const std::string excused = result.excused == 0 ? "" : std::to_string(result.excused) + " excused";
    if (result.checked == 0) {
      std::cout << "not checked, does not apply to these files: " << result.law
                << (excused.empty() ? "" : " (" + excused + ")") << "\n";
      continue;
    }
    const bool passed = result.broken == 0;
    passed_laws += passed ? 1 : 0;
    std::cout << (passed ? "passed: " : "FAILED: ") << result.law << " (" << result.checked << " checks";
    if (!excused.empty()) std::cout << ", " << excused;
    if (!passed) std::cout << ", " << result.broken << " failed, for example:\n" << result.example;
    std::cout << ")\n";
    failed += passed ? 0 : 1;
  }
  std::cout << passed_laws << " passed, " << failed << " failed\n";
  return failed == 0 ? 0 : 1;
}

}  // namespace

int HandleUnittestCommand(const CommandLineArguments& arguments) {
  if (arguments.size() != 2 && arguments.size() != 5) {
    errs << "Error: unittest command takes no paths or exactly 3 but " << arguments.size() - 2
         << " was provided.";
    ErrMsg(errs);
    return 1;
  }
  SetupRules(std::string(kDefaultRulesFile));
  Laws laws;
  if (arguments.size() == 2) {
    CheckOwnScenes(laws);
  } else if (!CheckUsersScene(arguments, laws)) {
    return 1;
  }
  return PrintResults(laws);
}

}  // namespace vexel_yaml
