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
/// stay as long as their conflict is there, or is settled or staged as the merge left it, and not committed:
/// until then, minds can be changed. One without a conflict is kept in git's folder alone. All paths are from
/// the top folder, which is the current one.
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

  /// Of all assets that have a record.
  std::vector<RecordEntry> Entries() const;

  /// Makes a record of the merge and returns its path; empty where it can't. `entry` is what is to be
  /// remembered, but for its blob: `hash` tells that as late as it is wanted.
  std::string Leave(RecordEntry entry, const AssetMerge& merge, const std::function<std::string()>& hash,
                    const MergeSettings& settings) const;

  void Remove(const std::string& asset) const;

  /// Removes the records that have done their duty, and says which files are staged as a merge left them,
  /// undecided, once. While git holds the index, a merge may be at work whose records are there before its
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
  };
  Places PlacesFor(const std::string& asset) const;
  /// Returns the record's path; empty where it can't.
  std::string Place(RecordEntry entry, const std::string& text, const std::function<std::string()>& hash,
                    bool may_use_hook) const;
  void TellStaged(RecordEntry entry) const;
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
