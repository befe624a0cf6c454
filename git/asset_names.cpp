#include "git/asset_names.h"

#include <algorithm>
#include <string_view>

#include "git/git_call.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kSuffix = ".meta";
constexpr std::string_view kBefore = "guid: ";
// To compare each line with more of them takes longer than to read all guids.
constexpr size_t kMostPatterns = 100;
constexpr size_t kGuidLength = 32;

bool IsGuid(const std::string& text) {
  return text.size() == kGuidLength && text.find_first_not_of("0123456789abcdef") == std::string::npos;
}

}  // namespace

AssetNames FindAssetNames(const std::set<std::string>& guids) {
  ProgramCall call = QuietCall(
      {"grep", "-z", "-o", "-G", "-I", "--full-name", "--no-color", "--no-line-number", "--no-column"});
  std::set<std::string> patterns;
  for (const std::string& guid : guids) {
    if (IsGuid(guid)) patterns.insert("^" + std::string(kBefore) + guid);
  }
  if (patterns.empty()) return {};
  if (patterns.size() > kMostPatterns) patterns = {"^" + std::string(kBefore) + "[0-9a-f]*"};
  for (const std::string& pattern : patterns) call.arguments.insert(call.arguments.end(), {"-e", pattern});
  call.arguments.insert(call.arguments.end(), {"--", "*" + std::string(kSuffix)});
  AssetNames names;
  // A path and a line each.
  std::string output = RunProgram(call).output;
  std::ranges::replace(output, '\n', '\0');
  const std::vector<std::string> pieces = Pieces(output, '\0');
  for (size_t i = 0; i + 1 < pieces.size(); i += 2) {
    const std::string name = pieces[i].substr(pieces[i].rfind('/') + 1);
    if (!name.ends_with(kSuffix) || !pieces[i + 1].starts_with(kBefore)) continue;
    std::string guid = pieces[i + 1].substr(kBefore.size());
    if (guids.contains(guid)) names.emplace(std::move(guid), name.substr(0, name.size() - kSuffix.size()));
  }
  return names;
}

std::string AssetLines(const std::vector<std::string>& scenes) {
  std::set<std::string> guids;
  for (const std::string& scene : scenes) {
    for (size_t at = scene.find(kBefore); at != std::string::npos; at = scene.find(kBefore, at)) {
      at += kBefore.size();
      guids.insert(scene.substr(at, kGuidLength));
    }
  }
  std::string lines;
  for (const auto& [guid, name] : FindAssetNames(guids)) lines += guid + ' ' + OnOneLine(name) + '\n';
  return lines;
}

}  // namespace vexel_yaml
