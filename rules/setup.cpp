#include "rules/setup.h"

#include <stdexcept>

#include "platform/hinted_error.h"
#include "rules/yaml_sequence_remapper.h"
#include "yaml/type_info.h"

namespace vexel_yaml {

void SetupRulesAndTypes(const std::string& rules_file, const std::string& type_info_file, TimerStat& timer) {
  {
    TimerStat step(timer, "Reading unique keys");
    SetupRules(rules_file);
  }
  if (type_info_file.empty()) return;
  TimerStat step(timer, "Read type info");
  try {
    SetupTypeInfo(type_info_file);
  } catch (const std::runtime_error& error) {
    throw HintedError(error.what(), "in type information file '" + type_info_file + "'");
  }
}

}  // namespace vexel_yaml
