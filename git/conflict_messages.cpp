#include "git/conflict_messages.h"

#include <algorithm>
#include <iostream>

#include "git/shown_text.h"

namespace vexel_yaml {

namespace {

// More would push what git says out of sight.
constexpr size_t kMostLines = 10;

std::vector<std::string> Lines(const std::string& name, const std::vector<RecordedConflict>& conflicts) {
  std::vector<std::string> lines;
  for (const RecordedConflict& conflict : conflicts) {
    if (!conflict.is_settled) lines.push_back("CONFLICT " + name + ": " + conflict.text);
  }
  return lines;
}

}  // namespace

void SayConflicts(const std::string& asset, const std::vector<RecordedConflict>& conflicts) {
  const std::vector<std::string> lines = Lines(Shown(asset), conflicts);
  const size_t shown = std::min(lines.size(), kMostLines);
  for (size_t i = 0; i < shown; ++i) std::cerr << lines[i] << '\n';
  if (shown < lines.size()) {
    std::cerr << "... and " << lines.size() - shown << " more: " << ResolveCall(asset, "check") << '\n';
  }
  std::cerr.flush();
}

void TellConflicts(const std::string& asset, const std::vector<RecordedConflict>& conflicts) {
  for (const std::string& line : Lines(asset, conflicts)) Tell(line);
}

std::string Unsettled(const RecordEntry& entry) {
  return CountOfConflicts(entry.CountPending()) +
         " that nobody has settled; to settle: " + ResolveCall(entry.asset) +
         ", or to keep what stands there: " + ResolveCall(entry.asset, "resolve --as-is");
}

std::string ResolveCall(const std::string& asset, const std::string& command) {
  return "vexel-merge-git " + command + (asset.starts_with('-') ? " -- " : " ") + Typeable(asset);
}

}  // namespace vexel_yaml
