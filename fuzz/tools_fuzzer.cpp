#include <cstdio>
#include <cstdlib>

#include "app/fallback_spec_file.h"
#include "app/fallback_tools.h"
#include "fuzz/support.h"
#include "platform/error_channel.h"

using namespace vexel_yaml;

namespace {

constexpr const char* kHostilePath = "a\"$(x)`x`\\%b %r";

// The arguments, with each path's double quotes, dollars and backquotes escaped, hold no more of these
// unescaped than the template did.
size_t CountBare(const std::string& text) {
  size_t count = 0;
  for (size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '\\') {
      ++i;
    } else if (text[i] == '"' || text[i] == '$' || text[i] == '`') {
      ++count;
    }
  }
  return count;
}

void CheckEntry(const FallbackCommandEntry& entry) {
  fuzz::Require(entry.mode >= 0 && entry.mode <= 2, "a tool has one of the three modes");
  fuzz::Require(entry.tool.find('"') == std::string::npos, "a tool's path ends at the quote");
  const std::string filled = SubstituteMergePlaceholderFilePaths(entry.arguments, kHostilePath, kHostilePath,
                                                                 kHostilePath, kHostilePath);
  if (entry.arguments.find('\\') != std::string::npos) return;
  fuzz::Require(CountBare(filled) == CountBare(entry.arguments), "a path adds nothing that a shell expands");
}

}  // namespace

// A list of tools is refused or gives entries of the form that it promises, which no path can break out of.
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  fuzz::SetUp();
  // A name that leads back to the open file: nothing is left behind, however the run ends.
  std::FILE* file = std::tmpfile();
  if (file == nullptr || std::fwrite(data, 1, size, file) != size || std::fflush(file) != 0) std::abort();
  std::rewind(file);
  errs.str("");
  FallbackCommandMap map;
  PopulateFallbacks(map, "/dev/fd/" + std::to_string(fileno(file)));
  std::fclose(file);
  for (const auto& [extension, entries] : map) {
    for (const FallbackCommandEntry& entry : entries) CheckEntry(entry);
    GetFallbackCommandEntry(map, "scene." + extension, "tools");
  }
  return 0;
}
