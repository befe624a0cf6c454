#pragma once

#include <string>
#include <string_view>
#include <vector>

/// A whole file, mapped for reading until the process ends. Throws std::runtime_error with path and reason.
std::string_view MapFile(const std::string& path);

/// The file's documents, each from its "---" to the next one's. What stands before the first is left out.
std::vector<std::string_view> SplitAtHeaders(std::string_view text);

/// Makes or empties the file and writes `text`, without waiting for the disk. Throws like MapFile.
void WriteWholeFile(const std::string& path, std::string_view text);
