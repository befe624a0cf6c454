#include "fuzz/support.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

using namespace vexel_yaml;

// Whatever is read and written must be readable, and be written the same again.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  std::string text;
  try {
    VexelObjects objects;
    ParseYAMLString(std::string(reinterpret_cast<const char*>(data), size), objects);
    text = fuzz::Written(objects);
  } catch (const YAMLError&) {
    return 0;
  }
  VexelObjects again;
  ParseYAMLString(text, again);
  fuzz::Require(fuzz::Written(again) == text, "a file that was written is written the same again");
  return 0;
}
