#include "git/report_pages.h"

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <optional>
#include <set>

#include "git/asset_merge.h"
#include "git/asset_names.h"
#include "git/conflict_records.h"
#include "git/decided_lines.h"
#include "git/git_call.h"
#include "git/merged_commits.h"
#include "git/path_names.h"
#include "git/report_index.h"
#include "git/repository.h"
#include "git/settings.h"
#include "git/shown_text.h"
#include "git/side_people.h"
#include "git/stage_files.h"
#include "git/work_files.h"
#include "platform/files.h"
#include "platform/progress.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

using Paths = std::vector<std::string>;

struct Arguments {
  std::string page;
  std::string commit;
  Paths paths;
};

Arguments Parse(const std::vector<std::string>& arguments) {
  Arguments parsed;
  auto argument = arguments.begin();
  for (; argument != arguments.end() && *argument != "--"; ++argument) {
    if (*argument == "-o") {
      if (++argument == arguments.end()) throw WrongUsage("-o needs a value");
      parsed.page = *argument;
    } else if (argument->starts_with('-')) {
      throw WrongUsage("unknown option '" + *argument + "'");
    } else {
      if (!parsed.commit.empty()) throw WrongUsage("paths stand behind --");
      parsed.commit = *argument;
    }
  }
  if (argument != arguments.end()) parsed.paths.assign(argument + 1, arguments.end());
  return parsed;
}

// The files below the paths, or all, that were in conflict until somebody staged them.
Paths StagedConflicts(const Paths& pathspecs) {
  ProgramCall call = GitCall({"ls-files", "-z", "--resolve-undo", "--full-name", "--"});
  call.arguments.insert(call.arguments.end(), pathspecs.begin(), pathspecs.end());
  std::set<std::string> paths;
  for (const std::string& entry : Pieces(Answer(call), '\0'))
    paths.insert(entry.substr(entry.find('\t') + 1));
  return {paths.begin(), paths.end()};
}

// Those that are not settled and committed.
Paths Remembered(Paths paths) {
  const Repository repository;
  const ConflictRecords records(repository);
  std::erase_if(paths, [&](const std::string& path) { return records.Entry(path).asset.empty(); });
  return paths;
}

// Made pages, one asset after the other.
class PageMaker {
 public:
  PageMaker(const Arguments& arguments, std::string page, const std::optional<MergedCommits>& merged)
      : shown_page_(arguments.page), page_(std::move(page)), merged_(merged) {}

  // False where there is no page, and that has been said.
  bool Make(const std::string& asset) {
    const Progress progress("Making the page of " + asset);
    AssetVersions versions;
    if (!(merged_ ? WriteMerged(asset, versions) : WriteUnmerged(asset, versions))) return false;
    const std::string target = page_.empty() ? DefaultPage(asset) : page_;
    Paths call = {GetDataFilesDir() + "vexel-merge-report", "--rules", settings_.rules};
    if (settings_.is_safe) call.emplace_back("--safe");
    call.emplace_back("--summary");
    if (!settings_.type_info.empty()) call.insert(call.end(), {"--typeInfo", settings_.type_info});
    // What is settled in the record of the conflict at hand shows as settled.
    const std::string record = merged_ ? std::string() : records_.Find(asset);
    if (!record.empty()) {
      scratch_.Write("decided", DecidedIn(record));
      call.insert(call.end(), {"-i", "decided"});
    }
    std::string title = asset;
    if (merged_)
      title += ": " + branches_.theirs + " merged into " + branches_.ours + " (" +
               ShortHash(merged_->commit) + ")";
    Paths files = {versions.base, versions.left, versions.right};
    // What was decided or edited by hand is in the commit alone.
    if (merged_ && !WriteVersion(merged_->commit, "committed", asset, scratch_).empty()) {
      call.insert(call.end(), {"--committed", "committed"});
      files.emplace_back("committed");
    }
    scratch_.Write("assets", AssetLines(TextsOf(files)));
    call.insert(call.end(), {"--assets", "assets"});
    const SideNames names = NamesFor(asset);
    call.insert(call.end(), {"--theirs", names.theirs, "--ours", names.ours});
    call.insert(call.end(), {"-o", target, "--title", title, versions.base, versions.left, versions.right});
    // From their folder, since the page shows the paths that were given.
    const ProgramResult result = RunProgram(
        {.arguments = call, .errors = ProgramCall::Errors::kInOutput, .folder = scratch_.GetPath()});
    if (result.status != 0) {
      SayMessages(WithRecord(result.output, ShownRecord(record)), versions);
      return false;
    }
    Tell(shown_page_.empty() ? target : shown_page_);
    // The last line is about the page, others are about the merge.
    const Paths lines = Pieces(result.output, '\n');
    const std::string folder = PagesFolder();
    if (target.starts_with(folder))
      pages_.push_back({asset, target.substr(folder.size()), lines.empty() ? std::string() : lines.back()});
    return true;
  }

  // Writes a page with links to all of them, if there are several.
  void MakeIndex() const {
    if (pages_.size() < 2) return;
    const std::string index = PagesFolder() + "index.html";
    if (!PutFile(index, IndexPage(pages_))) throw CommandError("cannot write " + index);
    Tell(index);
  }

 private:
  std::vector<std::string> TextsOf(const Paths& files) const {
    std::vector<std::string> texts;
    for (const std::string& file : files) texts.push_back(TextOf(scratch_.GetPath() + '/' + file));
    return texts;
  }

  SideNames NamesFor(const std::string& asset) const {
    if (merged_) return PeopleBehind(*merged_, branches_, asset);
    const RecordEntry entry = records_.Entry(asset);
    return WithPeople(entry.asset.empty() ? FindSideNames(repository_) : entry.names, repository_, asset);
  }

  bool WriteMerged(const std::string& asset, AssetVersions& versions) {
    const bool is_there = WriteVersions(*merged_, asset, scratch_, versions);
    if (!is_there) Say(asset + ": not in all three versions, so there is nothing to compare");
    // By their names, as the page shows them.
    for (std::string* version : {&versions.base, &versions.left, &versions.right}) {
      *version = version->substr(version->rfind('/') + 1);
    }
    return is_there;
  }

  bool WriteUnmerged(const std::string& asset, AssetVersions& versions) {
    if (!StageFiles(asset).Write(scratch_, versions)) return false;
    if (!versions.HasAsset()) {
      Say(asset + " was merged as text");
      return false;
    }
    versions = {asset, "base", "left", "right"};
    return true;
  }

  // Not all that an asset may be called has room for a suffix, and a folder can be called like another
  // asset's page.
  std::string DefaultPage(const std::string& asset) {
    const std::string pages = PagesFolder();
    std::string page = pages + asset + ".html";
    const size_t name_size = asset.size() - (asset.rfind('/') + 1);
    if (name_size <= 200 && MakeFoldersFor(page) && !IsFolder(page)) return page;
    MakeFoldersFor(pages);
    return pages + HashedPath(asset) + ".html";
  }

  std::string PagesFolder() const {
    return std::filesystem::absolute(repository_.Path("vexel-merge-report")).string() + "/";
  }

  // A mistake in the record, whose line is named, was read from a copy.
  static std::string WithRecord(const std::string& messages, const std::string& record) {
    const size_t end = messages.find(" specified on line ");
    if (record.empty() || end == std::string::npos) return messages;
    const size_t begin = messages.rfind("': ", end);
    const std::string message = begin == std::string::npos ? messages : messages.substr(begin + 3);
    return Shown(record) + ": " + message.substr(0, message.find(" (in merge resolve file "));
  }

  const std::string shown_page_;
  const std::string page_;
  const std::optional<MergedCommits>& merged_;
  const SideNames branches_ = merged_ ? BranchesOf(*merged_) : SideNames();
  const MergeSettings settings_ = SettingsQuery().Get();
  const Repository repository_;
  const ConflictRecords records_{repository_};
  ScratchFolder scratch_{repository_};
  std::vector<IndexedPage> pages_;
};

}  // namespace

int RunReportPages(const std::vector<std::string>& arguments) {
  const Arguments parsed = Parse(arguments);
  TopFolder();
  // Before the folder changes, from which the user's paths count.
  const std::string page =
      parsed.page.empty() ? "" : (std::filesystem::current_path() / parsed.page).string();
  std::optional<MergedCommits> merged;
  Paths paths, staged;
  if (!parsed.commit.empty()) {
    merged = FindMerged(parsed.commit);
    paths = ChangedOnBothSides(*merged, parsed.paths);
  } else {
    if (parsed.paths.empty()) GoToTop();
    paths = UnmergedBelow(parsed.paths).value_or(Paths());
    staged = StagedConflicts(parsed.paths);
  }
  GoToTop();
  staged = Remembered(std::move(staged));
  paths.insert(paths.end(), staged.begin(), staged.end());
  const Paths assets = OursAmong(paths);
  if (assets.empty()) {
    throw CommandError(merged ? "no file of ours was changed on both sides of " + parsed.commit
                              : "no file of ours is in conflict; name a merge commit");
  }
  if (!page.empty() && assets.size() > 1) {
    throw CommandError("-o takes the page of one file, and there are " + ListOf(assets) +
                       ": name one behind --, or leave -o out");
  }
  if (!page.empty() && LeavesTop(page)) {
    throw CommandError(parsed.page + " lies behind a symbolic link of the work tree, or is one");
  }
  PageMaker maker(parsed, page, merged);
  bool is_done = true;
  for (const std::string& asset : assets) is_done = maker.Make(asset) && is_done;
  maker.MakeIndex();
  return is_done ? 0 : 1;
}

}  // namespace vexel_yaml
