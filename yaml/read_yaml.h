#pragma once

#include <string>
#include <string_view>

#include "platform/file_text.h"
#include "yaml/document_cache.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// Reads an asset file into `objects`, which should be empty and stays so after a failure.
/// Returns false only when libyaml can't start. Throws FileError where the file can't be read to its end, and
/// YAMLError: "Cannot open file" (a folder counts), the 'Force text' message for a file that isn't one,
/// "Error locating end of document sequence", or what libyaml finds wrong.
/// With a `cache`, documents in the written style are folded, and what another reader of it has found out
/// about a document is not found out again.
bool ParseYAMLFile(const std::string& path, VexelObjects& objects, DocumentCache* cache = nullptr);

/// The same for a text, without the check of its first line. Every object is read at once.
bool ParseYAMLString(std::string_view text, VexelObjects& objects);

/// The same with a cache, which takes the text over.
bool ParseYAMLText(FileText text, VexelObjects& objects, DocumentCache& cache);

/// `ParseYAMLFile` for the commands: every failure is a YAMLError "Error parsing file '<path>': <reason>".
void ReadYAMLPath(const std::string& path, VexelObjects& objects, DocumentCache* cache = nullptr);

/// Reports the keys of a file that had to be left out, a line each, on standard error.
void ReportSkippedKeys(const std::string& path, const VexelObjects& objects);

/// Throws YAMLError for the first of them, with its line in the hint.
void RefuseSkippedKeys(const std::string& path, const VexelObjects& objects);

}  // namespace vexel_yaml
