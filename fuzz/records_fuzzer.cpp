#include <algorithm>
#include <sstream>

#include "diff/yaml_mapping_diff.h"
#include "fuzz/support.h"
#include "merge/conflict_record_file.h"
#include "rules/yaml_sequence_remapper.h"
#include "yaml/yaml_error.h"

using namespace vexel_yaml;

namespace {

// A control character is written as an escape, which then means the same. Behind a backslash it doesn't.
bool MeanTheSame(const YAMLScalar* a, const YAMLScalar* b) {
  return ResolveEscapes(a) == ResolveEscapes(b) || a->GetText().find('\\') != std::string_view::npos;
}

bool AreEqual(const std::vector<RecordingConflictResolver::RecordResolve>& a,
              const std::vector<RecordingConflictResolver::RecordResolve>& b) {
  return std::equal(a.begin(), a.end(), b.begin(), b.end(), [](const auto& x, const auto& y) {
    return x.resolution == y.resolution &&
           std::equal(x.pattern.begin(), x.pattern.end(), y.pattern.begin(), y.pattern.end(), MeanTheSame);
  });
}

}  // namespace

// Resolutions are refused, or they can be used, and the records written after that hold the same ones.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  RecordingConflictResolver resolver(MergeResolve::kBase);
  std::istringstream records(std::string(reinterpret_cast<const char*>(data), size));
  try {
    InputConflictRecords(records, resolver);
  } catch (const YAMLError&) {
    return 0;
  }
  const fuzz::Example& example = fuzz::GetExample();
  const std::unique_ptr<VexelObjects> merged(example.base.Clone());
  YAMLMappingDiff::Merge(*YAMLMappingDiff::Diff(example.base, example.left),
                         *YAMLMappingDiff::Diff(example.base, example.right), resolver)
      ->Apply(*merged);
  fuzz::Written(*merged);
  std::stringstream text;
  OutputConflictRecords(text, resolver, true);
  RecordingConflictResolver again(MergeResolve::kBase);
  InputConflictRecords(text, again);
  fuzz::Require(AreEqual(resolver.GetResolutions(), again.GetResolutions()),
                "resolutions that were written are read again");
  return 0;
}
