#include <stdexcept>

#include "app/laws.h"
#include "fixups/duplicate_keys.h"
#include "fixups/three_way_merge.h"
#include "fuzz/support.h"
#include "rules/yaml_sequence_remapper.h"
#include "yaml/yaml_error.h"

using namespace vexel_yaml;

namespace {

std::unique_ptr<VexelObjects> Read(const std::string& text) {
  std::unique_ptr<VexelObjects> scene = ReadScene(text);
  RefuseDuplicateKeys(*scene, "input");
  // A field that stands there twice, alike, is kept once, but counts twice in the hash of what was read: the
  // diff then shows a change where there is none, which is no matter for the laws.
  scene->RebuildHash(false);
  return scene;
}

}  // namespace

// The laws about one side hold for any three texts that can be merged at all. Those about both are not asked:
// what the lopsided rules for lists let vanish is in hostile texts at once, and lost_edits knows it by name.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  // A tolerance makes edits vanish that the laws ask for.
  YAMLSequenceRemapper::s_ComparisonFieldPaths.clear();
  const std::vector<std::string> texts = fuzz::SplitTexts(data, size, 3);
  Laws laws;
  try {
    SceneTriple triple = {Read(texts[0]), Read(texts[1]), Read(texts[2]), true};
    PrepareForDiff(*triple.base, *triple.left, *triple.right);
    laws.Check(triple);
  } catch (const YAMLError&) {
    return 0;
  } catch (const std::runtime_error&) {
    return 0;
  }
  for (const Laws::Result& result : laws.GetResults()) {
    const bool is_about_both = result.law.starts_with("two equal changes") ||
                               result.law.starts_with("every change of one side") ||
                               result.law.starts_with("with left and right swapped");
    fuzz::Require(is_about_both || result.broken == 0, (result.law + "\n" + result.example).c_str());
  }
  return 0;
}
