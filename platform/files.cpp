#include "platform/files.h"

#include <unistd.h>

#include <cstdlib>
#include <fstream>

#include "platform/error_channel.h"
#include "platform/executable_path.h"

namespace vexel_yaml {

std::string VexelToNativePath(const std::string& path) { return path; }

bool FileExists(const std::string& path) { return access(path.c_str(), F_OK) == 0; }

bool IsFileEmpty(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  // What can't be read may hold something.
  return file.peek() == std::ifstream::traits_type::eof() && !file.bad();
}

std::string GetFileExtension(const std::string& path) {
  const size_t dot = path.rfind('.');
  return dot == std::string::npos ? std::string() : path.substr(dot + 1);
}

std::string GetUserHomeDir() {
  const char* home = std::getenv("HOME");
  return home == nullptr ? std::string() : std::string(home);
}

std::string GetDataFilesDir() {
  const std::string executable = ExecutablePath();
  if (executable.empty()) {
    errs << "Couldn't locate dir of factory merge spec file\n";
    ErrMsg(errs);
    return {};
  }
  const size_t separator = executable.find_last_of("/\\");
  if (separator == std::string::npos) {
    errs << "My path is invalid\n";
    ErrMsg(errs);
    return {};
  }
  return executable.substr(0, separator + 1);
}

std::string GetDataFilePath(const std::string& name) {
  const std::string folder = GetDataFilesDir();
  return folder.empty() ? std::string() : folder + name;
}

}  // namespace vexel_yaml
