#include "app/fallback_tools.h"

#include <sys/wait.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <iostream>

#include "app/command_line.h"
#include "app/fallback_spec_file.h"
#include "platform/error_channel.h"
#include "platform/file_replacement.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

constexpr const char* kDataFilesVariable = "VEXEL_DATA_FILES";

// Paths come from repositories: a file named "$(...)" must not run anything on the machine that merges it.
void AppendEscaped(const std::string& path, std::string& text) {
  for (const char c : VexelToNativePath(path)) {
    if (std::string_view("\"$`\\").find(c) != std::string_view::npos) text += '\\';
    text += c;
  }
}

// `error_number` is set where the system says why it could not start the shell, else 0.
int RunInShell(const std::string& command, int& error_number) {
  std::cout.flush();
  // The program ignores this signal, and the tool would inherit that: writing into a closed pipe, it would go
  // on for ever instead of ending.
  void (*const previous)(int) = std::signal(SIGPIPE, SIG_DFL);
  // What an earlier call left here (a file that was not found) would be taken for the shell's.
  errno = 0;
  const int result = std::system(command.c_str());
  error_number = errno;
  std::signal(SIGPIPE, previous);
  return result;
}

}  // namespace

std::string SubstituteMergePlaceholderFilePaths(std::string_view arguments, const std::string& base,
                                                const std::string& left, const std::string& right,
                                                const std::string& dest) {
  const auto path_for = [&](char letter) -> const std::string* {
    switch (letter) {
      case 'b':
        return &base;
      case 'l':
        return &left;
      case 'r':
        return &right;
      case 'd':
        return &dest;
      default:
        return nullptr;
    }
  };
  std::string result;
  // In one pass: a path may hold the text of a placeholder itself.
  for (size_t i = 0; i < arguments.size(); ++i) {
    const bool may_begin = arguments[i] == '%' && i + 1 < arguments.size();
    if (const std::string* path = may_begin ? path_for(arguments[i + 1]) : nullptr) {
      AppendEscaped(*path, result);
      ++i;
    } else {
      result += arguments[i];
    }
  }
  return result;
}

int FallbackMergeTool(const std::string& base, const std::string& left, const std::string& right,
                      const std::string& dest, const std::string& spec_file) {
  if (spec_file == kNoSpecFile) return 1;
  const std::string spec_path = GetSpecFilename(spec_file);
  FallbackCommandMap map;
  // After a failure the entries before the bad line still count.
  PopulateFallbacks(map, spec_path);
  if (map.empty()) return 1;
  const FallbackCommandEntry entry = GetFallbackCommandEntry(map, left, spec_path);
  if (entry.tool.empty()) return 1;
  const std::string arguments = SubstituteMergePlaceholderFilePaths(entry.arguments, base, left, right, dest);
  if (!FileExists(dest)) ReplaceFile(VexelToNativePath(dest), "");

  // For lists that name a script of the program's, whose folder they can't know.
  setenv(kDataFilesVariable, GetDataFilesDir().c_str(), 1);
  int error_number = 0;
  const int result = RunInShell('"' + entry.tool + "\" " + arguments, error_number);
  if (result == -1 || (result == 0 && error_number == ENOENT)) {
    errs << "Could not start fallback merge command '" << entry.tool << "' code " << result << ' '
         << std::strerror(error_number) << '\n';
    ErrMsg(errs);
  }
  return result;
}

int ExitStatusOfTool(int system_result) {
  if (system_result == -1 || system_result == 1) return 1;
  if (WIFEXITED(system_result)) return WEXITSTATUS(system_result);
  return WIFSIGNALED(system_result) ? 128 + WTERMSIG(system_result) : 1;
}

}  // namespace vexel_yaml
