#pragma once

#include <optional>
#include <string>

#include "platform/file_text.h"

namespace vexel_yaml {

/// The content of the file at `path`, which may be a pipe. Nothing where it can't be opened (a folder
/// counts); errno says why. Throws FileError where it can't be read to its end: a part must never be taken
/// for the whole. May be called from any thread.
std::optional<std::string> ReadWholeFile(const std::string& path);

/// The same for a file that may be large.
std::optional<FileText> ReadFileText(const std::string& path);

}  // namespace vexel_yaml
