#pragma once

#include <map>
#include <string>
#include <vector>

namespace vexel_yaml {

/// One line of the fallback specification file: an outside merge tool for one kind of file.
struct FallbackCommandEntry {
  std::string tool;       ///< Path of the executable.
  std::string arguments;  ///< With placeholders for the files, in the shell's language.
  int mode = 0;           ///< "use" 0, "use-on-conflict" 1, "use-second-pass" 2; makes no difference so far.
};

/// The entries of each file extension, in file order. Those of "*" are for any kind of file.
using FallbackCommandMap = std::map<std::string, std::vector<FallbackCommandEntry>>;

/// The specification file for the value of "--fallback": for "auto" the user's own hidden one, else the one
/// beside the executable; any other value is a path already.
std::string GetSpecFilename(const std::string& spec);

/// Adds the file's entries to `map`. False after a failure, which has been reported; a line with a mode that
/// doesn't exist ends the reading, and the entries before it stay.
bool PopulateFallbacks(FallbackCommandMap& map, const std::string& path);

/// The first entry for the extension of `path`, and then for "*", whose tool exists. Where there is none the
/// tool is empty, which has been reported; `spec_file` is named in that message.
FallbackCommandEntry GetFallbackCommandEntry(const FallbackCommandMap& map, const std::string& path,
                                             const std::string& spec_file);

}  // namespace vexel_yaml
