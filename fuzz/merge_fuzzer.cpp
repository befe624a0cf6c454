#include <cstdint>
#include <sstream>
#include <stdexcept>
#include <string>

#include "diff/yaml_mapping_diff.h"
#include "fixups/duplicate_keys.h"
#include "fixups/file_id_collisions.h"
#include "fixups/post_process.h"
#include "merge/recording_conflict_resolver.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

namespace {

using namespace vexel_yaml;

// The three versions, separated by a zero byte.
std::string TakeVersion(std::string& input) {
  const std::string version = input.substr(0, input.find('\0'));
  input.erase(0, version.size() + 1);
  return "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n" + version;
}

void Merge(std::string input) {
  VexelObjects versions[3];
  DocumentCache cache;
  for (VexelObjects& version : versions) {
    ParseYAMLString(TakeVersion(input), version, &cache);
    RefuseDuplicateKeys(version, "input");
  }
  auto& [base, left, right] = versions;
  ConflictingFileIDs ids =
      CreateConflictingFileIDsRemapper(PreProcess(base), PreProcess(left), PreProcess(right));
  RemapCollidingAddFileIDs(ids, left, right);
  RecordingConflictResolver resolver(MergeResolve::kBase);
  const YAMLMappingDiff* merged = YAMLMappingDiff::Merge(*YAMLMappingDiff::Diff(base, left),
                                                         *YAMLMappingDiff::Diff(base, right), resolver);
  merged->Apply(base);
  PostProcessMergeOnly(base, left, right, resolver);
  std::ostringstream out;
  base.Output(out);
}

}  // namespace

// A merge ends with a result or with an error of its own, never otherwise.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const bool ready = [] {
    initialize();
    std::istringstream rules("");
    YAMLSequenceRemapper::LoadSequenceUniqueKeys(rules);
    return true;
  }();
  if (!ready) return 0;
  try {
    Merge(std::string(reinterpret_cast<const char*>(data), size));
  } catch (const YAMLError&) {
    return 0;
  } catch (const std::length_error&) {
    return 0;
  } catch (const std::runtime_error&) {
    return 0;
  }
  return 0;
}
