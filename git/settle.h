#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "git/asset_merge.h"
#include "git/conflict_records.h"
#include "git/hand_edits.h"
#include "git/settings.h"

namespace vexel_yaml {

class Prompt;

/// How somebody wants the conflicts of a file to be settled.
struct Choice {
  /// "left", "right" or "base"; empty for what an editor makes of the record.
  std::string side;
  /// Of which places that holds; empty for all.
  std::string pattern;
  /// Whether edits of the file may be lost.
  bool force = false;
  /// Asks about one conflict after the other instead, where it is given; not owned.
  Prompt* prompt = nullptr;
  /// Whether all is to stay as it stands in the work tree.
  bool as_is = false;
  /// What has been decided already, instead of what the record says: the text of another one.
  std::optional<std::string> decided = std::nullopt;
  /// The work tree's file as whoever has decided that has seen it: no other edits are kept unasked.
  std::optional<std::string> seen = std::nullopt;
  /// Whether the file stays in conflict even if nothing in it is left open.
  bool stays_open = false;
};

/// What settling needs to know of the repository.
struct SettleContext {
  const ConflictRecords& records;
  const MergeSettings& settings;
  const Choice& choice;
  const SideNames& names;
  /// Whether the file is still in the conflict that it was in, once an editor has been closed.
  std::function<bool()> is_same_conflict = [] { return true; };
};

/// A merge with what somebody has decided.
struct Settlement {
  /// As of `merge`.
  int status = AssetMerge::kFailed;
  /// Null where it has failed.
  std::unique_ptr<AssetMerge> merge;
  /// What the merge makes of the file, with what was edited by hand since the last one.
  std::string text;
  /// What to remember of it, without the blob.
  RecordEntry entry;
};

/// Merges the file of the work tree once more, with what the user decides now, and leaves it to the caller to
/// write the result. What went wrong has been said.
///
/// What somebody has edited by hand since the last merge is merged into it, and a conflict that is settled
/// like that is none. Only where such an edit meets what is chosen now, nothing is done.
///
/// With a side, it takes as many merges as it takes until nothing fits any more, three at most: what hangs on
/// a decision can be decided only once that counts.
Settlement Settle(const AssetVersions& versions, const SettleContext& context);

/// Writes the work tree's file. Returns whether it could; else it has said so.
bool PutAsset(const std::string& asset, std::string_view text);

}  // namespace vexel_yaml
