#pragma once

#include <istream>
#include <ostream>
#include <string>
#include <string_view>

#include "merge/recording_conflict_resolver.h"

namespace vexel_yaml {

/// The pieces of `text` between the dots, interned.
FieldPath StringToPath(std::string_view text);

/// Writes the record file: what is pending, the user's resolutions and, with `describe`, what was settled.
void OutputConflictRecords(std::ostream& out, const RecordingConflictResolver& resolver, bool describe);

/// Reads the resolutions of a record file and installs them in file order. Throws YAMLError, with the 1-based
/// line number: "No handling type (left,right,base) specified on line ",
/// "Unknown handling type '<word>' (should be left,right or base) specified on line ",
/// "No property path specified on line ".
void InputConflictRecords(std::istream& in, RecordingConflictResolver& resolver);

/// The same for the record file at `path`. Returns false where it can't be opened (a folder counts),
/// with the reason in errno. Throws FileError where it can't be read.
bool InputConflictRecords(const std::string& path, RecordingConflictResolver& resolver);

}  // namespace vexel_yaml
