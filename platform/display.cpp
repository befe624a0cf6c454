#include "platform/display.h"

#include <cstdlib>

namespace vexel_yaml {

namespace {

bool IsSet(const char* name) {
  const char* value = std::getenv(name);
  return value != nullptr && *value != '\0';
}

}  // namespace

bool HasDisplay() {
  if (IsSet("SSH_CONNECTION")) return false;
#ifdef __APPLE__
  return true;
#else
  return IsSet("DISPLAY") || IsSet("WAYLAND_DISPLAY");
#endif
}

}  // namespace vexel_yaml
