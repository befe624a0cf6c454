#include "git/conflict_records.h"

#include <dirent.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <sstream>

#include "git/folder_lock.h"
#include "git/git_call.h"
#include "git/marked_block.h"
#include "git/name_in_use.h"
#include "git/path_names.h"
#include "git/record_hook.h"
#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/read_whole_file.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kSuffix = ".vexel-conflicts";
constexpr std::string_view kHeading = "Conflict handling:";

// Whether it still looks like one, also after somebody has taken one of the two lines out.
bool IsRecord(const std::string& path) {
  if (!IsFile(path)) return false;
  // What can't be read is somebody else's.
  return std::ranges::any_of(Pieces(ReadWholeFile(path).value_or(""), '\n'), [](const std::string& line) {
    return line.starts_with("# What is in conflict in ") || line.starts_with(kHeading);
  });
}

bool IsForUs(const std::string& path) {
  if (!IsPlain(path)) return false;
  ProgramCall call = GitCall({"ls-files", "-z", "--", ":(literal)" + path});
  // A command of the user may be at work on another index.
  call.without = {kIndexVariable};
  const ProgramResult tracked = RunProgram(call);
  return tracked.status == 0 && tracked.output.empty();
}

std::string RecordText(const std::string& asset, const AssetMerge& merge) {
  std::string text =
      "# What is in conflict in " + Escaped(asset) +
      ". Left is \"theirs\", right is \"ours\".\n"
      "# To settle a conflict, take the \"#\" off its line at the end, and leave one of the three "
      "words. Then:\n"
      "#   " +
      ResolveCall(asset) + "\n" + merge.GetRecord();
  for (const ListedConflict& conflict : merge.GetConflicts())
    text += "# left|right|base " + conflict.place + "\n";
  return text;
}

}  // namespace

ConflictRecords::ConflictRecords(const Repository& repository)
    : repository_(repository), folder_(repository.Path("vexel-merge-records")) {}

ConflictRecords::Places ConflictRecords::PlacesFor(const std::string& asset) const {
  const std::string kept = folder_ + "/" + HashedPath(asset);
  return {"./" + asset + std::string(kSuffix), kept + std::string(kSuffix), kept + ".path"};
}

std::string ConflictRecords::Find(const std::string& asset) const {
  const Places places = PlacesFor(asset);
  if (IsFile(places.entry) && IsRecord(places.beside) && IsForUs(asset + std::string(kSuffix)))
    return places.beside;
  return IsFile(places.kept) ? places.kept : std::string();
}

std::string ConflictRecords::RecordedHash(const std::string& asset) const {
  const std::vector<std::string> lines = Pieces(TextOf(PlacesFor(asset).entry), '\n');
  return lines.size() < 2 ? std::string() : lines[1];
}

std::string ConflictRecords::Leave(const std::string& asset, const AssetMerge& merge,
                                   const std::function<std::string()>& hash,
                                   const MergeSettings& settings) const {
  const std::string text = RecordText(asset, merge);
  std::string record;
  {
    const FolderLock lock(repository_);
    record = Place(asset, text, hash, !settings.has_other_hooks);
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

// Remembered first, so that no record is there that nobody removes.
std::string ConflictRecords::Place(const std::string& asset, const std::string& text,
                                   const std::function<std::string()>& hash, bool may_use_hook) const {
  const Places places = PlacesFor(asset);
  const std::string name = asset + std::string(kSuffix);
  // Git answers while the files are looked at.
  NameInUse in_use(repository_, name);
  const bool is_ours = IsFile(places.entry) && IsRecord(places.beside);
  const bool is_free = access(places.beside.c_str(), F_OK) != 0;
  const bool is_for_us = IsPlain(name) && !in_use.Get();
  // The first version had a list of this name.
  if (IsFile(folder_)) unlink(folder_.c_str());
  if (mkdir(folder_.c_str(), 0777) != 0 && !IsFolder(folder_)) return {};
  if (!PutFile(places.entry, QuotedPath(asset) + "\n" + hash() + "\n")) return {};
  if (may_use_hook) PlaceHook(repository_);
  if (!PutFile(places.kept, text)) return {};
  if ((is_ours || is_free) && is_for_us && MakeFoldersFor(places.beside) && PutFile(places.beside, text)) {
    return places.beside;
  }
  return places.kept;
}

void ConflictRecords::Remove(const std::string& asset) const {
  const Places places = PlacesFor(asset);
  if (Find(asset) == places.beside) unlink(places.beside.c_str());
  unlink(places.kept.c_str());
  unlink(places.entry.c_str());
}

void ConflictRecords::Sweep() const {
  if (!IsFolder(folder_)) return;
  const FolderLock lock(repository_);
  if (repository_.IsLocked()) return;
  const auto unmerged = UnmergedBelow({}, false);
  if (!unmerged) return;
  std::error_code error;
  for (const auto& file : std::filesystem::directory_iterator(folder_, error)) {
    if (file.path().extension() != ".path") continue;
    const std::vector<std::string> lines = Pieces(TextOf(file.path().string()), '\n');
    if (lines.empty()) {
      // A crash has left it without its text.
      unlink(std::filesystem::path(file.path()).replace_extension(kSuffix).c_str());
      unlink(file.path().c_str());
      continue;
    }
    const std::string asset = UnquotedPath(lines.front());
    if (!std::ranges::binary_search(*unmerged, asset)) Remove(asset);
  }
  RemoveHook();
}

// With the last record of this work tree: the hook goes, unless another one has a record.
void ConflictRecords::RemoveHook() const {
  std::error_code error;
  for (const auto& file : std::filesystem::directory_iterator(folder_, error)) {
    // What a killed process has left is no record.
    if (file.path().filename().string().starts_with(".vexel-")) unlink(file.path().c_str());
  }
  if (rmdir(folder_.c_str()) != 0 || HaveAny()) return;
  if (GitQuietly({"config", "--get", "core.hooksPath"}).status != 0) TakeHookAway(repository_);
}

bool ConflictRecords::HaveAny() const {
  if (IsFolder(repository_.CommonPath("vexel-merge-records"))) return true;
  std::error_code error;
  for (const auto& tree : std::filesystem::directory_iterator(repository_.CommonPath("worktrees"), error)) {
    if (IsFolder((tree.path() / "vexel-merge-records").string())) return true;
  }
  return false;
}

std::string ResolveCall(const std::string& asset) {
  return (asset.starts_with('-') ? "vexel-merge-git resolve -- " : "vexel-merge-git resolve ") +
         Typeable(asset);
}

std::string ShownRecord(std::string_view record) {
  if (record.starts_with("./")) record.remove_prefix(2);
  return std::string(record);
}

std::string DecidedIn(const std::string& record) {
  std::vector<std::string> lines = Pieces(TextOf(record), '\n');
  const auto last = std::find_if(lines.rbegin(), lines.rend(), [](const std::string& line) {
    return line == kHeading || line == std::string(kHeading) + '\r';
  });
  std::string text;
  for (auto line = lines.begin(); line != lines.end(); ++line) {
    if (last != lines.rend() && line >= last.base() - 1) text += *line;
    text += '\n';
  }
  if (last == lines.rend()) text += std::string(kHeading) + '\n';
  return text;
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
