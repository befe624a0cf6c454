#pragma once

#include <string>

#include "platform/timer_stat.h"

namespace vexel_yaml {

/// Loads the rules and, where a path is given, the type information: the first step of every command.
/// Throws what SetupRules and SetupTypeInfo throw.
void SetupRulesAndTypes(const std::string& rules_file, const std::string& type_info_file, TimerStat& timer);

}  // namespace vexel_yaml
