#include "fuzz/support.h"

#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <sstream>

#include "fixups/duplicate_keys.h"
#include "fixups/post_process.h"
#include "fixups/three_way_merge.h"
#include "platform/error_channel.h"
#include "rules/yaml_sequence_remapper.h"
#include "yaml/read_yaml.h"

namespace vexel_yaml::fuzz {

namespace {

constexpr const char* kBase =
    "--- !v!1 &1\nGameObject:\n  m_Component:\n  - component: {fileID: 2}\n  - component: {fileID: 3}\n"
    "  m_Name: Lamp\n"
    "--- !v!4 &2\nTransform:\n  m_GameObject: {fileID: 1}\n  m_LocalPosition: {x: 0, y: 2.5, z: 0}\n"
    "  m_Children: []\n  m_Father: {fileID: 0}\n"
    "--- !v!114 &3\nMonoBehaviour:\n  m_GameObject: {fileID: 1}\n  list: [a, b, b, c]\n";
constexpr const char* kLeft =
    "--- !v!1 &1\nGameObject:\n  m_Component:\n  - component: {fileID: 2}\n  - component: {fileID: 3}\n"
    "  - component: {fileID: 4}\n  m_Name: Street Lamp\n"
    "--- !v!4 &2\nTransform:\n  m_GameObject: {fileID: 1}\n  m_LocalPosition: {x: 0, y: 4, z: 0}\n"
    "  m_Children:\n  - {fileID: 5}\n  m_Father: {fileID: 0}\n"
    "--- !v!114 &3\nMonoBehaviour:\n  m_GameObject: {fileID: 1}\n  list: [a, b, d, b, c]\n"
    "--- !v!65 &4\nBoxCollider:\n  m_GameObject: {fileID: 1}\n"
    "--- !v!4 &5\nTransform:\n  m_Children: []\n  m_Father: {fileID: 2}\n";
constexpr const char* kRight =
    "--- !v!1 &1\nGameObject:\n  m_Component:\n  - component: {fileID: 2}\n  - component: {fileID: 6}\n"
    "  m_Name: Old Lamp\n"
    "--- !v!4 &2\nTransform:\n  m_GameObject: {fileID: 1}\n  m_LocalPosition: {x: 0, y: 2.5, z: 7}\n"
    "  m_Children: []\n  m_Father: {fileID: 0}\n"
    "--- !v!135 &6\nSphereCollider:\n  m_GameObject: {fileID: 1}\n  list: [e, a]\n";

}  // namespace

void SetUp() {
  static const bool done = [] {
    std::cerr.rdbuf(nullptr);
    gHeadlessEnabled = true;
    initialize();
    SetupRules(VEXEL_RULES_FILE);
    return true;
  }();
  static_cast<void>(done);
}

std::vector<std::string> SplitTexts(const uint8_t* data, size_t size, size_t count) {
  std::string rest(reinterpret_cast<const char*>(data), size);
  std::vector<std::string> texts;
  while (texts.size() < count) {
    texts.push_back(rest.substr(0, rest.find('\0')));
    rest.erase(0, texts.back().size() + 1);
  }
  return texts;
}

std::string WithDirectives(const std::string& documents) {
  return "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n" + documents;
}

std::string Written(VexelObjects& objects) {
  std::ostringstream out;
  objects.Output(out);
  return out.str();
}

const Example& GetExample() {
  static const Example& example = []() -> const Example& {
    auto& read = *new Example;
    ParseYAMLString(WithDirectives(kBase), read.base);
    ParseYAMLString(WithDirectives(kLeft), read.left);
    ParseYAMLString(WithDirectives(kRight), read.right);
    return read;
  }();
  return example;
}

std::unique_ptr<VexelObjects> Merge(VexelObjects& base, VexelObjects& left, VexelObjects& right,
                                    RecordingConflictResolver& resolver, bool threads) {
  for (const VexelObjects* version : {&base, &left, &right}) RefuseDuplicateKeys(*version, "input");
  PrepareForDiff(base, left, right);
  TimerStat silent("", nullptr);
  const DiffPair diffs = CreateDiffPair({base, left}, {base, right}, threads, silent);
  std::unique_ptr<VexelObjects> merged = MergeIntoCopy(base, diffs, resolver, silent);
  PostProcessMergeOnly(*merged, left, right, resolver);
  return merged;
}

void Require(bool holds, const char* what) {
  if (holds) return;
  std::fprintf(stderr, "not so: %s\n", what);
  std::abort();
}

}  // namespace vexel_yaml::fuzz
