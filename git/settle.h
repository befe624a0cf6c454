#pragma once

#include <functional>
#include <string>

#include "git/asset_merge.h"
#include "git/conflict_records.h"
#include "git/settings.h"

namespace vexel_yaml {

/// How somebody wants the conflicts of a file to be settled.
struct Choice {
  /// "left", "right" or "base"; empty for what an editor makes of the record.
  std::string side;
  /// Of which places that holds; empty for all.
  std::string pattern;
  /// Whether edits of the file may be lost.
  bool force = false;
};

/// What settling needs to know of the repository.
struct SettleContext {
  const ConflictRecords& records;
  const MergeSettings& settings;
  const Choice& choice;
  /// Whether the file is still in the conflict that it was in, once an editor has been closed.
  std::function<bool()> is_same_conflict = [] { return true; };
};

/// Merges the file of the work tree once more, with what the user decides now. Returns the status of `merge`,
/// which then holds the merge, and in the work tree, too, where nothing is pending. What went wrong has been
/// said.
int Settle(const AssetVersions& versions, const SettleContext& context, AssetMerge& merge);

/// Writes the work tree's file. Returns whether it could; else it has said so.
bool PutAsset(const std::string& asset, std::string_view text);

/// The blob that git would make of the work tree's file; empty where there is none.
std::string HashOfAsset(const std::string& asset);

}  // namespace vexel_yaml
