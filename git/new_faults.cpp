#include "git/new_faults.h"

#include <new>
#include <set>

#include "report/merged_files.h"
#include "report/object_names.h"
#include "report/value_text.h"
#include "scene/scene_check.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

bool IsAssetText(const std::string& text) { return text.starts_with("%YAML"); }

void Parse(const std::string& text, VexelObjects& objects) {
  // The parser could not even start.
  if (!ParseYAMLString(text, objects)) throw std::bad_alloc();
}

std::set<SceneFault> FaultsIn(const std::string& text) {
  if (!IsAssetText(text)) return {};
  try {
    VexelObjects objects;
    Parse(text, objects);
    const std::vector<SceneFault> faults = CheckScene(objects);
    return {faults.begin(), faults.end()};
  } catch (const YAMLError&) {
    return {};
  }
}

}  // namespace

std::vector<std::string> NewFaults(const std::string& text, const std::vector<std::string>& before) {
  if (!IsAssetText(text)) return {};
  std::set<SceneFault> old;
  for (const std::string& version : before) old.merge(FaultsIn(version));
  std::vector<std::string> lines;
  try {
    VexelObjects objects;
    Parse(text, objects);
    ObjectNames names({&objects});
    for (const SceneFault& fault : CheckScene(objects)) {
      if (old.contains(fault)) continue;
      const std::string name = OnOneLine(names.Describe(fault.file_id));
      lines.push_back((name.empty() ? "object" : name) + " (" + OnOneLine(fault.file_id->GetText()) + ") " +
                      OnOneLine(fault.text));
    }
  } catch (const YAMLError& error) {
    lines.push_back("can't be read: " + OnOneLine(Explained(error)));
  }
  return lines;
}

}  // namespace vexel_yaml
