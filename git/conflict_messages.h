#pragma once

#include <string>
#include <vector>

#include "git/record_entry.h"

namespace vexel_yaml {

/// Says each conflict of the asset that is pending, in a line; after the first ten, how many more there are,
/// and the command that shows all of them.
void SayConflicts(const std::string& asset, const std::vector<RecordedConflict>& conflicts);

/// Prints all of them to standard output.
void TellConflicts(const std::string& asset, const std::vector<RecordedConflict>& conflicts);

/// Such as "2 conflicts that nobody has settled", and how to go on.
std::string Unsettled(const RecordEntry& entry);

/// The command that settles the conflicts in this file, or with `command`, another one.
std::string ResolveCall(const std::string& asset, const std::string& command = "resolve");

}  // namespace vexel_yaml
