#include <sstream>
#include <stdexcept>

#include "fuzz/support.h"
#include "merge/conflict_record_file.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

using namespace vexel_yaml;

namespace {

// All that a user would get to see of a merge: the file and the records, or the error.
std::string Merge(const std::vector<std::string>& texts, DocumentCache* cache) try {
  VexelObjects versions[3];
  for (size_t i = 0; i < std::size(versions); ++i) {
    if (cache == nullptr) {
      ParseYAMLString(texts[i], versions[i]);
    } else {
      ParseYAMLText(FileText(texts[i]), versions[i], *cache);
    }
  }
  RecordingConflictResolver resolver(MergeResolve::kBase);
  const auto merged = fuzz::Merge(versions[0], versions[1], versions[2], resolver);
  std::ostringstream records;
  OutputConflictRecords(records, resolver, true);
  return fuzz::Written(*merged) + records.str();
} catch (const YAMLError& error) {
  return std::string(error.what()) + error.GetHint();
} catch (const std::runtime_error& error) {
  return error.what();
} catch (const std::logic_error& error) {
  return error.what();
}

}  // namespace

// A merge gives the same whether what stands in all versions is taken apart or not.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  std::vector<std::string> texts = fuzz::SplitTexts(data, size, 3);
  for (std::string& text : texts) text = fuzz::WithDirectives(text);
  DocumentCache cache;
  fuzz::Require(Merge(texts, &cache) == Merge(texts, nullptr), "folded objects are merged like others");
  return 0;
}
