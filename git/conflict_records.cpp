#include "git/conflict_records.h"

#include <dirent.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <optional>

#include "git/conflict_messages.h"
#include "git/decided_lines.h"
#include "git/folder_lock.h"
#include "git/git_call.h"
#include "git/marked_block.h"
#include "git/name_in_use.h"
#include "git/path_names.h"
#include "git/record_hook.h"
#include "git/settled_by_hand.h"
#include "git/setup.h"
#include "git/shown_text.h"
#include "git/stage_files.h"
#include "git/work_files.h"
#include "platform/file_error.h"
#include "platform/read_whole_file.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kSuffix = ".vexel-conflicts";
constexpr std::string_view kEntrySuffix = ".path";
constexpr std::string_view kMergedSuffix = ".merged";

// Whether it still looks like one, also after somebody has taken one of the two lines out.
bool IsRecord(const std::string& path) {
  if (!IsFile(path)) return false;
  const std::optional<std::string> text = ReadWholeFile(path);
  // What may not be read is somebody else's.
  if (!text && errno != EACCES) throw FileError(FileError::Step::kReading, path, errno);
  return std::ranges::any_of(Pieces(text.value_or(""), '\n'), [](const std::string& line) {
    return line.starts_with("# What is in conflict in ") || line.starts_with(kDecidedHeading);
  });
}

bool IsForUs(const std::string& path) {
  if (!IsPlain(path)) return false;
  ProgramCall call = GitCall({"ls-files", "-z", "--", ":(literal)" + path});
  // A command of the user may be at work on another index.
  call.without = {kIndexVariable};
  return Answer(call).empty();
}

std::string WithName(const std::string& side, const std::string& name) {
  return name.empty() ? side : side + " (" + name + ")";
}

std::string RecordText(const RecordEntry& entry, const AssetMerge& merge) {
  std::string text =
      "# What is in conflict in " + Escaped(entry.asset) + ". Left is " +
      WithName("theirs", entry.names.theirs) + ", right is " + WithName("ours", entry.names.ours) +
      ".\n"
      "# To settle a conflict, take the \"#\" off its line at the end, and leave one of the three "
      "words. Then:\n"
      "#   " +
      ResolveCall(entry.asset) + "\n" + merge.GetRecord();
  for (const RecordedConflict& conflict : entry.conflicts) {
    if (!conflict.is_settled) text += "# " + conflict.text + "\n# theirs|ours|base " + conflict.place + "\n";
  }
  return text;
}

}  // namespace

ConflictRecords::ConflictRecords(const Repository& repository)
    : repository_(repository), folder_(repository.Path("vexel-merge-records")) {}

ConflictRecords::Places ConflictRecords::PlacesFor(const std::string& asset) const {
  const std::string kept = folder_ + "/" + HashedPath(asset);
  return {"./" + asset + std::string(kSuffix), kept + std::string(kSuffix), kept + std::string(kEntrySuffix),
          kept + std::string(kMergedSuffix)};
}

std::string ConflictRecords::Find(const std::string& asset) const {
  const Places places = PlacesFor(asset);
  if (IsFile(places.entry) && IsRecord(places.beside) && IsForUs(asset + std::string(kSuffix)))
    return places.beside;
  return IsFile(places.kept) ? places.kept : std::string();
}

RecordEntry ConflictRecords::Entry(const std::string& asset) const {
  return ReadEntry(PlacesFor(asset).entry);
}

std::string ConflictRecords::MergedText(const std::string& asset) const {
  return TextOf(PlacesFor(asset).merged);
}

void ConflictRecords::MarkSettledByHand(RecordEntry& entry, const std::string& text,
                                        const MergeSettings& settings) const {
  const std::string merged = MergedText(entry.asset);
  if (merged.empty()) {
    // It could not be merged, or not by this version of the program.
    for (RecordedConflict& conflict : entry.conflicts) conflict.is_settled = true;
    return;
  }
  const auto sides = [&] {
    ScratchFolder scratch(repository_);
    AssetVersions versions;
    const StageFiles stages(entry.asset);
    if (!stages.AreComplete() || !stages.Write(scratch, versions)) return SideTexts();
    return SideTexts{TextOf(versions.base), TextOf(versions.left)};
  };
  vexel_yaml::MarkSettledByHand(merged, text, settings, sides, entry.conflicts);
}

std::vector<RecordEntry> ConflictRecords::Entries() const {
  std::vector<RecordEntry> entries;
  for (const std::filesystem::path file : PathsIn(folder_)) {
    if (file.extension() != kEntrySuffix) continue;
    entries.push_back(ReadEntry(file.string()));
    // A crash has left it without its text.
    if (!entries.back().asset.empty()) continue;
    entries.pop_back();
    for (const std::string_view suffix : {kSuffix, kMergedSuffix})
      unlink(std::filesystem::path(file).replace_extension(suffix).c_str());
    unlink(file.c_str());
  }
  std::ranges::sort(entries, {}, &RecordEntry::asset);
  return entries;
}

std::string ConflictRecords::Leave(RecordEntry entry, const AssetMerge& merge, std::string_view merged,
                                   const std::function<std::string()>& hash,
                                   const MergeSettings& settings) const {
  std::string record;
  {
    const FolderLock lock(repository_);
    record = Place(std::move(entry), merge, merged, hash, settings.hooks_folder);
  }
  if (record.empty()) return record;
  // The record is there all the same.
  try {
    ExcludeRecords(repository_);
  } catch (const std::exception& error) {
    Complain(error.what());
  }
  return record;
}

bool ConflictRecords::LeaveUnmerged(RecordEntry entry, const std::function<std::string()>& hash,
                                    const MergeSettings& settings) const {
  const FolderLock lock(repository_);
  Remove(entry.asset);
  return Remember(PlacesFor(entry.asset), entry, hash, settings.hooks_folder);
}

bool ConflictRecords::Remember(const Places& places, RecordEntry& entry,
                               const std::function<std::string()>& hash,
                               const std::string& hooks_folder) const {
  // The first version had a list of this name.
  if (IsFile(folder_)) unlink(folder_.c_str());
  if (mkdir(folder_.c_str(), 0777) != 0 && !IsFolder(folder_)) return false;
  entry.hash = hash();
  if (entry.hash.empty() || !WriteEntry(places.entry, entry)) return false;
  const bool are_placed = !hooks_folder.empty() || PlaceHooks(repository_);
  const std::vector<std::string> foreign = ForeignGuards(repository_, hooks_folder);
  if (!foreign.empty()) {
    TellUnguarded("hooks of your own are in use (" + Joined(foreign) + ")");
  } else if (!are_placed) {
    TellUnguarded("no hooks can be placed here");
  }
  return true;
}

// Once in a merge of many files, in which git holds one lock.
void ConflictRecords::TellUnguarded(const std::string& reason) const {
  const std::string mark = folder_ + "/.vexel-told";
  const std::string lock = repository_.LockMark();
  if (lock.empty() || TextOf(mark) == lock) return;
  PutFile(mark, lock);
  Say("warning: " + reason +
      ", so nothing stops a commit of what nobody has settled: run 'vexel-merge-git check --staged' before "
      "it");
}

// Remembered first, so that no record is there that nobody removes.
std::string ConflictRecords::Place(RecordEntry entry, const AssetMerge& merge, std::string_view merged,
                                   const std::function<std::string()>& hash,
                                   const std::string& hooks_folder) const {
  const Places places = PlacesFor(entry.asset);
  const std::string name = entry.asset + std::string(kSuffix);
  const bool is_beside = entry.CountPending() > 0;
  // Git answers while the files are looked at.
  std::optional<NameInUse> in_use;
  if (is_beside) in_use.emplace(repository_, name);
  const bool is_ours = IsFile(places.entry) && IsRecord(places.beside);
  const bool is_free = access(places.beside.c_str(), F_OK) != 0;
  // Asked before anything is written.
  const bool is_for_us = in_use ? IsPlain(name) && !in_use->Get() : is_ours && IsForUs(name);
  const std::string text = RecordText(entry, merge);
  if (!Remember(places, entry, hash, hooks_folder)) return {};
  if (!PutFile(places.merged, merged) || !PutFile(places.kept, text)) return {};
  if (!is_beside) {
    // Where it stays, it would be read.
    const bool is_gone = !is_for_us || unlink(places.beside.c_str()) == 0 || errno == ENOENT;
    return is_gone ? places.kept : std::string();
  }
  if ((is_ours || is_free) && is_for_us && MakeFoldersFor(places.beside) && PutFile(places.beside, text)) {
    return places.beside;
  }
  return places.kept;
}

RecordEntry ConflictRecords::EntryFor(const std::string& asset, const std::string& hash) const {
  RecordEntry entry = Entry(asset);
  if (!entry.asset.empty()) return entry;
  for (RecordEntry& renamed : Entries()) {
    if (renamed.hash == hash) return std::move(renamed);
  }
  return entry;
}

void ConflictRecords::TakeAsIs(RecordEntry entry, const std::string& hash) const {
  if (entry.asset.empty()) return;
  const FolderLock lock(repository_);
  entry.hash = hash;
  for (RecordedConflict& conflict : entry.conflicts) conflict.is_settled = true;
  const Places places = PlacesFor(entry.asset);
  WriteEntry(places.entry, entry);
  if (Find(entry.asset) == places.beside) unlink(places.beside.c_str());
}

std::vector<std::string> ConflictRecords::FilesOf(const std::string& asset) const {
  const Places places = PlacesFor(asset);
  return {places.beside, places.kept, places.entry, places.merged};
}

void ConflictRecords::Remove(const std::string& asset) const {
  const Places places = PlacesFor(asset);
  if (Find(asset) == places.beside) unlink(places.beside.c_str());
  for (const std::string& file : {places.kept, places.merged, places.entry}) unlink(file.c_str());
}

// With the last record of this work tree: the hooks go, unless another one has a record.
void ConflictRecords::RemoveHooks() const {
  for (const std::string& file : PathsIn(folder_)) {
    // What a killed process has left is no record.
    if (file.substr(file.rfind('/') + 1).starts_with(".vexel-")) unlink(file.c_str());
  }
  if ((rmdir(folder_.c_str()) != 0 && errno != ENOENT) || HaveAny()) return;
  if (GitQuietly({"config", "--get", "core.hooksPath"}).status != 0) TakeHooksAway(repository_);
}

bool ConflictRecords::HaveAny() const {
  if (IsFolder(repository_.CommonPath("vexel-merge-records"))) return true;
  return std::ranges::any_of(PathsIn(repository_.CommonPath("worktrees")),
                             [](const std::string& tree) { return IsFolder(tree + "/vexel-merge-records"); });
}

std::string ShownRecord(std::string_view record) {
  if (record.starts_with("./")) record.remove_prefix(2);
  return std::string(record);
}

std::string ExcludeFile(const Repository& repository) {
  const std::string exclude = repository.CommonPath("info/exclude");
  return IsLink(exclude) || IsLink(repository.CommonPath("info")) ? std::string() : exclude;
}

bool ExcludeRecords(const Repository& repository) {
  const std::string exclude = ExcludeFile(repository);
  if (exclude.empty()) return false;
  const SetupState state(repository.CommonPath("vexel-merge"));
  return MarkedBlock(exclude, "exclude", state).Set("*" + std::string(kSuffix));
}

}  // namespace vexel_yaml
