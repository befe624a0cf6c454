#include <stdexcept>

#include "fixups/post_process.h"
#include "fuzz/support.h"
#include "merge/recording_conflict_resolver.h"
#include "yaml/read_yaml.h"
#include "yaml/type_info.h"
#include "yaml/yaml_error.h"

using namespace vexel_yaml;

// Type information is refused, or the component checks can be run with it, whatever it says of the classes.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  VexelObjects types;
  try {
    ParseYAMLString(std::string(reinterpret_cast<const char*>(data), size), types);
    GetTypeInfoManager().Read(types);
  } catch (const YAMLError&) {
    return 0;
  } catch (const std::runtime_error&) {
    return 0;
  }
  const fuzz::Example& example = fuzz::GetExample();
  RecordingConflictResolver resolver(MergeResolve::kBase);
  for (const VexelObjects* version : {&example.base, &example.left}) {
    const std::unique_ptr<VexelObjects> merged(version->Clone());
    PostProcess(*merged, example.left, example.right, resolver);
  }
  return 0;
}
