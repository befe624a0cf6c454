#include <cstdint>
#include <cstdlib>
#include <sstream>
#include <string>

#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

namespace {

std::string Written(vexel_yaml::VexelObjects& objects) {
  std::ostringstream out;
  objects.Output(out);
  return out.str();
}

}  // namespace

// Whatever is read and written must be readable, and be written the same again.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  using namespace vexel_yaml;
  static const bool ready = (initialize(), true);
  if (!ready) return 0;
  std::string text;
  try {
    VexelObjects objects;
    ParseYAMLString(std::string(reinterpret_cast<const char*>(data), size), objects);
    text = Written(objects);
  } catch (const YAMLError&) {
    return 0;
  }
  VexelObjects again;
  ParseYAMLString(text, again);
  if (Written(again) != text) std::abort();
  return 0;
}
