#include "platform/executable_path.h"

#include <cstdint>
#include <filesystem>
#include <system_error>

#ifdef __APPLE__
#include <mach-o/dyld.h>
#endif

namespace vexel_yaml {

std::string ExecutablePath() {
  std::error_code error;
#ifdef __APPLE__
  char buffer[1024];
  uint32_t size = sizeof(buffer);
  if (_NSGetExecutablePath(buffer, &size) != 0) return {};
  const std::filesystem::path path = std::filesystem::canonical(buffer, error);
#else
  const std::filesystem::path path = std::filesystem::read_symlink("/proc/self/exe", error);
#endif
  return error ? std::string() : path.string();
}

}  // namespace vexel_yaml
