#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "git/asset_merge.h"
#include "git/record_entry.h"
#include "git/repository.h"

namespace vexel_yaml {

/// The records of conflicts that lie beside the assets: written by the merge driver, read by resolve. They
/// stay as long as their conflict is there, or is settled and not committed, so that minds can be changed,
/// or left open in what is staged, in the work tree or in the stash. One without a conflict is kept in git's
/// folder alone. All paths are from the top folder, which is the current one.
///
/// Only what is remembered in git's folder is ours: a file of such a name that the repository tracks, or that
/// somebody else has put there, is neither read nor written. Then, and where the name would be too long or
/// lies behind a symbolic link, the record is the one that is kept in git's folder. There is one in any case,
/// since git checks out what the other side has added only after the merge, also over the one beside the
/// asset.
class ConflictRecords {
 public:
  explicit ConflictRecords(const Repository& repository);

  /// The path of this asset's record; empty where it has none.
  std::string Find(const std::string& asset) const;

  /// Whether the record is the one in git's folder.
  bool IsKept(const std::string& record) const { return record.starts_with(folder_ + "/"); }

  /// What is remembered of this asset; the entry's asset is empty where it has no record.
  RecordEntry Entry(const std::string& asset) const;

  /// How the merge left the asset; empty where that isn't known.
  std::string MergedText(const std::string& asset) const;

  /// Marks the conflicts as settled that somebody has settled by hand in `text`, a later version of the file.
  void MarkSettledByHand(RecordEntry& entry, const std::string& text, const MergeSettings& settings) const;

  /// Of all assets that have a record.
  std::vector<RecordEntry> Entries() const;

  /// Makes a record of the merge and returns its path; empty where it can't. `entry` is what is to be
  /// remembered, but for its blob: `hash` tells that as late as it is wanted. `merged` is the merge that the
  /// file in the work tree has come from.
  std::string Leave(RecordEntry entry, const AssetMerge& merge, std::string_view merged,
                    const std::function<std::string()>& hash, const MergeSettings& settings) const;

  /// Remembers a file that could not be merged and stays as ours has it, so that it doesn't slip into a
  /// commit like that. It has no record. Returns whether it could.
  bool LeaveUnmerged(RecordEntry entry, const std::function<std::string()>& hash,
                     const MergeSettings& settings) const;

  /// The entry of the asset or, since what both sides have renamed is remembered by its old name, of one that
  /// the merge left as this blob; its asset is empty where there is neither.
  RecordEntry EntryFor(const std::string& asset, const std::string& hash) const;

  /// Remembers of such an entry that everything in the work tree's file, this blob, is meant to be as it
  /// stands.
  void TakeAsIs(RecordEntry entry, const std::string& hash) const;

  /// What an asset's record is kept in, whether it is there or not.
  std::vector<std::string> FilesOf(const std::string& asset) const;

  void Remove(const std::string& asset) const;

  /// Removes the records that have done their duty, and says once of what is staged how much of it nobody has
  /// settled. While git holds the index, a merge may be at work whose records are there before its
  /// conflicts: what it leaves can be swept when it is done. `is_committed`: what is staged is committed,
  /// too.
  void Sweep(bool is_committed = false) const;

  /// Whether any work tree of this repository has a record.
  bool HaveAny() const;

 private:
  struct Places {
    std::string beside;
    std::string kept;
    std::string entry;
    std::string merged;
  };
  Places PlacesFor(const std::string& asset) const;
  bool Remember(const Places& places, RecordEntry& entry, const std::function<std::string()>& hash,
                const std::string& hooks_folder) const;
  void TellUnguarded(const std::string& reason) const;
  /// Returns the record's path; empty where it can't.
  std::string Place(RecordEntry entry, const AssetMerge& merge, std::string_view merged,
                    const std::function<std::string()>& hash, const std::string& hooks_folder) const;
  struct IndexState;
  bool IsStaged(const RecordEntry& entry, const IndexState& index) const;
  bool TellStaged(RecordEntry entry, const std::string& blob) const;
  bool IsOpenIn(const RecordEntry& entry, const std::string& text) const;
  void RemoveHooks() const;

  const Repository& repository_;
  std::string folder_;
};

/// The path as people write it.
std::string ShownRecord(std::string_view record);

/// Keeps records out of git's sight: they are for one person on one machine. Returns whether that changed
/// anything. Throws CommandError where it can't.
bool ExcludeRecords(const Repository& repository);

/// The file that says so; empty where it lies behind a symbolic link, and isn't the repository's.
std::string ExcludeFile(const Repository& repository);

}  // namespace vexel_yaml
