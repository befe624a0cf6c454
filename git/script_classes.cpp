#include "git/script_classes.h"

#include <algorithm>
#include <string_view>

#include "git/git_call.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kSuffix = ".cs.meta";
constexpr std::string_view kBefore = "guid: ";
// A scene in which everything is in conflict has more lines than anybody reads.
constexpr size_t kMostGuids = 100;

bool IsGuid(const std::string& text) {
  return text.size() == 32 && text.find_first_not_of("0123456789abcdef") == std::string::npos;
}

}  // namespace

ScriptClasses FindScriptClasses(const std::set<std::string>& guids) {
  ProgramCall call = GitCall(
      {"grep", "-z", "-o", "-G", "-I", "--full-name", "--no-color", "--no-line-number", "--no-column"});
  call.errors = ProgramCall::Errors::kDropped;
  size_t count = 0;
  for (const std::string& guid : guids) {
    if (!IsGuid(guid) || ++count > kMostGuids) continue;
    call.arguments.insert(call.arguments.end(), {"-e", "^" + std::string(kBefore) + guid});
  }
  if (count == 0) return {};
  call.arguments.insert(call.arguments.end(), {"--", "*" + std::string(kSuffix)});
  ScriptClasses classes;
  // A path and a line each.
  std::string output = RunProgram(call).output;
  std::ranges::replace(output, '\n', '\0');
  const std::vector<std::string> pieces = Pieces(output, '\0');
  for (size_t i = 0; i + 1 < pieces.size(); i += 2) {
    const std::string name = pieces[i].substr(pieces[i].rfind('/') + 1);
    if (!name.ends_with(kSuffix) || !pieces[i + 1].starts_with(kBefore)) continue;
    classes.emplace(pieces[i + 1].substr(kBefore.size()), name.substr(0, name.size() - kSuffix.size()));
  }
  return classes;
}

}  // namespace vexel_yaml
