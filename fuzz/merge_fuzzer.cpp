#include <stdexcept>

#include "fuzz/support.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

using namespace vexel_yaml;

namespace {

std::string Merge(const std::vector<std::string>& texts) {
  VexelObjects versions[3];
  DocumentCache cache;
  for (size_t i = 0; i < std::size(versions); ++i) {
    ParseYAMLText(FileText(fuzz::WithDirectives(texts[i])), versions[i], cache);
  }
  RecordingConflictResolver resolver(MergeResolve::kBase);
  const auto merged = fuzz::Merge(versions[0], versions[1], versions[2], resolver);
  return fuzz::Written(*merged);
}

}  // namespace

// A merge of the three texts ends with an error of its own or with a file that can be read.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  std::string text;
  try {
    text = Merge(fuzz::SplitTexts(data, size, 3));
  } catch (const YAMLError&) {
    return 0;
  } catch (const std::length_error&) {
    return 0;
  } catch (const std::runtime_error&) {
    return 0;
  }
  VexelObjects again;
  ParseYAMLString(text, again);
  return 0;
}
