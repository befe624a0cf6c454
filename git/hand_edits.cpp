#include "git/hand_edits.h"

#include <utility>

#include "git/conflict_messages.h"
#include "git/git_call.h"
#include "git/settled_by_hand.h"
#include "git/shown_text.h"
#include "git/stage_files.h"
#include "git/work_files.h"
#include "platform/files.h"

namespace vexel_yaml {

std::optional<HandEdits> FindHandEdits(const AssetVersions& versions, const RecordEntry& entry,
                                       const std::string& merged, const MergeSettings& settings) {
  const std::string& asset = versions.asset;
  HandEdits edits;
  if (!FileExists("./" + asset)) return edits;
  std::string text = TextOf("./" + asset);
  if (text == merged ||
      HashOfAsset(asset, text) == (merged.empty() ? entry.hash : HashOfAsset(asset, merged))) {
    return edits;
  }
  if (HasMarkers(asset)) {
    Complain(asset + " was merged as text; say --force to merge it anew, and lose what was edited since");
    return std::nullopt;
  }
  if (merged.empty()) {
    Complain(asset + " was edited after the merge; to take it so: " + ResolveCall(asset, "resolve --as-is") +
             ", or say --force to lose the edits");
    return std::nullopt;
  }
  edits.text = std::move(text);
  std::vector<RecordedConflict> conflicts = entry.conflicts;
  for (RecordedConflict& conflict : conflicts) conflict.is_settled = false;
  const auto sides = [&] { return SideTexts{TextOf(versions.base), TextOf(versions.left)}; };
  edits.settled = FindSettledByHand(merged, edits.text, settings, sides, conflicts);
  return edits;
}

std::string EditedObjects(const std::string& asset, const std::string& merged, const HandEdits& edits,
                          const MergeSettings& settings) {
  ScratchFolder scratch;
  const std::string before = scratch.Write("merged", merged);
  AssetMerge merge({asset, before, scratch.Write("edited", edits.text), before});
  merge.ListEdits();
  merge.RunQuietly(settings);
  return ListOf(merge.GetEdits().theirs);
}

bool HasMarkers(const std::string& asset) {
  const std::string text = TextOf("./" + asset);
  return text.starts_with("<<<<<<< ") || text.find("\n<<<<<<< ") != std::string::npos;
}

std::string HashOfAsset(const std::string& asset) { return HashOfAsset(asset, TextOf("./" + asset)); }

std::string HashOfAsset(const std::string& asset, std::string text) {
  std::string hash = HashIn(RunProgram(HashCall(asset, std::move(text))));
  // Two that are unknown aren't the same.
  if (hash.empty()) throw CommandError("git cannot say the blob of " + asset);
  return hash;
}

}  // namespace vexel_yaml
