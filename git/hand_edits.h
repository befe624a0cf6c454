#pragma once

#include <map>
#include <optional>
#include <string>

#include "git/asset_merge.h"
#include "git/record_entry.h"
#include "git/settings.h"

namespace vexel_yaml {

/// What somebody has made of a file of the work tree since it was merged.
struct HandEdits {
  /// The file as it is now; empty where it is as the merge left it.
  std::string text;
  /// The places of the conflicts that were settled like that, with what stands there now.
  std::map<std::string, std::string> settled;
};

/// Compares the work tree's file with `merged`, how the merge left it, or where that isn't known, with what
/// `entry` remembers. Nothing where the edits can't be kept, which has been said.
std::optional<HandEdits> FindHandEdits(const AssetVersions& versions, const RecordEntry& entry,
                                       const std::string& merged, const MergeSettings& settings);

/// The names of the objects that were edited, a few at most, for people.
std::string EditedObjects(const std::string& asset, const std::string& merged, const HandEdits& edits,
                          const MergeSettings& settings);

/// Whether the work tree's file has what a merge of texts leaves at a conflict.
bool HasMarkers(const std::string& asset);

/// The blob that git would make of the work tree's file or of a text in its place.
/// Throws CommandError where it can't tell.
std::string HashOfAsset(const std::string& asset);
std::string HashOfAsset(const std::string& asset, std::string text);

}  // namespace vexel_yaml
