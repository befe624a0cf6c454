#pragma once

#include <string>
#include <vector>

#include "git/asset_merge.h"
#include "git/side_names.h"

namespace vexel_yaml {

/// A conflict as it is remembered from its merge until the commit.
struct RecordedConflict {
  std::string place;
  /// The conflict in one line, with the sides' names.
  std::string text;
  /// By which it is known when it comes again.
  std::string key;
  bool is_settled = false;
};

/// What git's folder remembers of an asset beside its record's text.
struct RecordEntry {
  std::string asset;
  /// The blob of the asset as the merge left it, to see whether somebody has edited it since.
  std::string hash;
  SideNames names;
  std::vector<RecordedConflict> conflicts;
  /// The staged blob of which somebody has been told that it is undecided.
  std::string told_hash;

  size_t CountPending() const;
};

/// Reads an entry; its asset is empty where there is none.
RecordEntry ReadEntry(const std::string& path);

/// Returns whether it could.
bool WriteEntry(const std::string& path, const RecordEntry& entry);

/// What is pending after a merge, to be remembered. Those of `earlier` that aren't any more are settled.
std::vector<RecordedConflict> ConflictsAfter(AssetMerge& merge, const std::string& asset,
                                             const SideNames& names,
                                             const std::vector<RecordedConflict>& earlier);

}  // namespace vexel_yaml
