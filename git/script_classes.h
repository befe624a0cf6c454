#pragma once

#include "report/conflict_names.h"

namespace vexel_yaml {

/// Finds the scripts' classes by the names of the .meta files that hold their guids, among the tracked ones
/// of the work tree, whose top folder is the current one.
///
/// One call of git grep for all guids: it reads on several threads and knows the files without walking the
/// folders. Reading them from the commits instead would take several times as long, and scripts hardly ever
/// change their guids.
ScriptClasses FindScriptClasses(const std::set<std::string>& guids);

}  // namespace vexel_yaml
