#include <algorithm>
#include <set>

#include "git/conflict_messages.h"
#include "git/conflict_records.h"
#include "git/folder_lock.h"
#include "git/git_call.h"
#include "git/index_state.h"
#include "git/record_hook.h"
#include "git/shown_text.h"
#include "git/work_files.h"

namespace vexel_yaml {

// What git knows of the assets that have a record and are in conflict no more.
struct ConflictRecords::IndexState {
  // As git remembers for a while; after a commit that says nothing.
  std::set<std::string> were_in_conflict;
  // What the next commit changes.
  std::map<std::string, std::string> changes;
  std::map<std::string, std::string> blobs;
};

void ConflictRecords::Sweep(bool is_committed) const {
  // Hooks alone are what a work tree has left that is gone, and its records with it.
  if (!IsFolder(folder_) && (HaveAny() || !HaveHooks(repository_))) return;
  const FolderLock lock(repository_);
  if (repository_.IsLocked()) return;
  auto paths = PathsInConflict();
  if (!paths) return;
  std::vector<RecordEntry> entries = Entries();
  std::erase_if(entries, [&](const RecordEntry& entry) { return paths->unmerged.contains(entry.asset); });
  std::vector<std::string> assets;
  for (const RecordEntry& entry : entries) assets.push_back(entry.asset);
  auto blobs = IndexBlobs(assets);
  if (!blobs) return;
  IndexState index;
  if (!is_committed) index.were_in_conflict = std::move(paths->staged);
  if (!assets.empty()) index.changes = StagedChanges(false);
  index.blobs = std::move(*blobs);
  const std::set<std::string> edited = EditedFiles(assets);
  for (const RecordEntry& entry : entries) {
    const bool is_kept =
        IsStaged(entry, index) ||
        (edited.contains(entry.asset) && IsOpenIn(entry, TextOf("./" + entry.asset))) ||
        (IsFile(repository_.CommonPath("refs/stash")) &&
         IsOpenIn(entry, GitQuietly({"cat-file", "blob", "refs/stash:" + entry.asset}).output));
    if (!is_kept) Remove(entry.asset);
  }
  RemoveHooks();
}

bool ConflictRecords::IsStaged(const RecordEntry& entry, const IndexState& index) const {
  const auto blob = index.blobs.find(entry.asset);
  if (blob != index.blobs.end()) {
    const bool is_part = index.changes.contains(entry.asset) || index.were_in_conflict.contains(entry.asset);
    return is_part && TellStaged(entry, blob->second);
  }
  // Both sides have renamed it, and each of the new names has what the merge left.
  const auto renamed =
      std::ranges::find_if(index.changes, [&](const auto& change) { return change.second == entry.hash; });
  return renamed != index.changes.end() && TellStaged(entry, renamed->second);
}

// Says once of a blob what is open in it. Returns whether the record is needed for it.
bool ConflictRecords::TellStaged(RecordEntry entry, const std::string& blob) const {
  if (blob == entry.told_hash) return true;
  RecordEntry staged = entry;
  if (blob != entry.hash) {
    MarkSettledByHand(staged, GitQuietly({"cat-file", "blob", blob}).output, SettingsQuery().Get());
    if (staged.CountPending() == 0) return false;
  }
  if (staged.CountPending() == 0) return true;
  Say("warning: " + entry.asset + " is staged with " + Unsettled(staged));
  entry.told_hash = blob;
  WriteEntry(PlacesFor(entry.asset).entry, entry);
  return true;
}

bool ConflictRecords::IsOpenIn(const RecordEntry& entry, const std::string& text) const {
  if (text.empty()) return false;
  RecordEntry there = entry;
  MarkSettledByHand(there, text, SettingsQuery().Get());
  return there.CountPending() > 0;
}

}  // namespace vexel_yaml
