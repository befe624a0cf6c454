#include <optional>
#include <stdexcept>

#include "diff/yaml_mapping_diff.h"
#include "fuzz/support.h"
#include "merge/recording_conflict_resolver.h"
#include "rules/yaml_sequence_remapper.h"
#include "tests/support/yaml_text.h"

using namespace vexel_yaml;

namespace {

bool EndsInLineNumber(const std::string& message) {
  const size_t blank = message.find_last_of(' ');
  return message.find(" at line ") != std::string::npos && message.back() == '\n' &&
         message.find_first_not_of("0123456789\n", blank + 1) == std::string::npos;
}

}  // namespace

// Rules are refused with the number of a line, or they can be used: under rules without tolerances, which
// make edits vanish, the diff of a version still leads to that version.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  // The first to go out of force are the default rules.
  { const ScopedRules forgotten(""); }
  std::optional<ScopedRules> rules;
  try {
    rules.emplace(std::string_view(reinterpret_cast<const char*>(data), size));
  } catch (const std::runtime_error& error) {
    fuzz::Require(EndsInLineNumber(error.what()), "a rule that is refused is found by its line");
    return 0;
  }
  const fuzz::Example& example = fuzz::GetExample();
  try {
    const YAMLMappingDiff* left = YAMLMappingDiff::Diff(example.base, example.left);
    const YAMLMappingDiff* right = YAMLMappingDiff::Diff(example.base, example.right);
    RecordingConflictResolver resolver(MergeResolve::kBase);
    const std::unique_ptr<VexelObjects> merged(example.base.Clone());
    YAMLMappingDiff::Merge(*left, *right, resolver)->Apply(*merged);
    fuzz::Written(*merged);
    if (!YAMLSequenceRemapper::s_ComparisonFieldPaths.empty()) return 0;
    const std::unique_ptr<VexelObjects> applied(example.base.Clone());
    left->Apply(*applied);
    fuzz::Require(applied->HasSameContent(example.left), "a diff under these rules leads to its version");
  } catch (const std::length_error&) {
    return 0;
  }
  return 0;
}
