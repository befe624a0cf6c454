#pragma once

#include <string>
#include <string_view>

namespace vexel_yaml {

/// `arguments` with "%b", "%l", "%r" and "%d" replaced by the base, left, right and destination path. What a
/// shell would expand inside double quotes is escaped in the paths, so a template that quotes its
/// placeholders is safe for one level of shell.
std::string SubstituteMergePlaceholderFilePaths(std::string_view arguments, const std::string& base,
                                                const std::string& left, const std::string& right,
                                                const std::string& dest);

/// Hands the files to the outside merge tool that the fallback specification file (a value of "--fallback")
/// has for the kind of `left`, and waits for it. The destination exists (empty if need be) when the tool
/// starts (throws FileError where it can't be made), and the environment variable VEXEL_DATA_FILES holds the
/// folder of the data files. Returns what `system` returned, or 1, with the reason reported, where no tool
/// was found.
int FallbackMergeTool(const std::string& base, const std::string& left, const std::string& right,
                      const std::string& dest, const std::string& spec_file);

/// The exit status for a result of `FallbackMergeTool`, as a shell makes it: the tool's exit code, or 128 and
/// the number of the signal that ended it. 1 where no tool ran. Never 0 unless the tool returned 0.
int ExitStatusOfTool(int system_result);

}  // namespace vexel_yaml
