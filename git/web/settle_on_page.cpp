#include "git/web/settle_on_page.h"

#include <algorithm>
#include <iostream>
#include <memory>
#include <stdexcept>
#include <utility>

#include "git/asset_names.h"
#include "git/captured_errors.h"
#include "git/decided_lines.h"
#include "git/git_call.h"
#include "git/merged_commits.h"
#include "git/mergetool.h"
#include "git/next_step.h"
#include "git/nothing_open.h"
#include "git/repository.h"
#include "git/resolve_arguments.h"
#include "git/resolving.h"
#include "git/shown_text.h"
#include "git/side_people.h"
#include "git/web/next_steps.h"
#include "git/web/page_options.h"
#include "git/work_files.h"
#include "platform/file_error.h"
#include "report/merged_files.h"
#include "report/value_text.h"
#include "view/view_server.h"

namespace vexel_yaml {

namespace {

// What errors begin with on a terminal.
constexpr std::string_view kError = "error: ";

// Runs `settle`, and throws what it has said unless it succeeds, for the page to show.
template <typename Settle>
void OrThrow(Settle settle) {
  std::string said;
  bool is_settled = false;
  {
    const CapturedErrors captured;
    try {
      is_settled = settle();
    } catch (const std::runtime_error& error) {
      std::cerr << error.what();
    }
    said = captured.Text();
  }
  if (!is_settled) throw std::runtime_error(OnOneLine(said.empty() ? "error: it can't be staged" : said));
  std::cerr << said << std::flush;
}

ViewFile PageFile(const AssetVersions& versions, const MergeSettings& settings,
                  const Repository& repository) {
  const SideNames names = WithPeople(FindSideNames(repository), repository, versions.asset);
  ViewFile file = {versions.asset, versions.base, versions.left, versions.right};
  file.safe = settings.is_safe;
  file.theirs_name = names.theirs;
  file.ours_name = names.ours;
  file.asset_search = FindAssetNames;
  file.has_temporary_paths = true;
  const ConflictRecords records(repository);
  const std::string record = records.Find(versions.asset);
  if (record.empty()) return file;
  file.known_pending = records.Entry(versions.asset).CountPending();
  try {
    file.resolutions = ReadResolutions(ScratchFolder(repository).Write("decided", DecidedIn(record)));
  } catch (const YAMLError& error) {
    throw CommandError(ShownRecord(record) + ": " + error.what());
  }
  return file;
}

// Takes what was edited by hand over. False where it can't be kept, which has been said.
bool ShowHandEdits(const AssetVersions& versions, const MergeSettings& settings, const Repository& repository,
                   ViewFile& file) {
  const ConflictRecords records(repository);
  if (records.Find(versions.asset).empty()) return true;
  const std::string merged = records.MergedText(versions.asset);
  const auto edits = FindHandEdits(versions, records.Entry(versions.asset), merged, settings);
  if (!edits) return false;
  file.settled_by_hand = edits->settled;
  if (edits->text.empty()) return true;
  file.note = "Edits made by hand are kept: " + EditedObjects(versions.asset, merged, *edits, settings);
  return true;
}

// The choice of whoever has settled the file on the page. What was edited meanwhile is shown by a refusal.
class PageChoice {
 public:
  explicit PageChoice(const std::string& asset) : path_("./" + asset), seen_(TextOf(path_)) {}

  Choice Next(const std::string& record) {
    Choice choice;
    choice.decided = record;
    choice.seen = std::exchange(seen_, TextOf(path_));
    return choice;
  }

  // After a choice that has been written.
  void LookAgain() { seen_ = TextOf(path_); }

 private:
  const std::string path_;
  std::string seen_;
};

// A file with its versions, which are there as long as the page is.
class ResolvedFile {
 public:
  ResolvedFile(const Repository& repository, const MergeSettings& settings, const std::string& asset,
               bool force)
      : repository_(repository), settings_(settings), asset_(asset), force_(force), stages_(asset) {}

  // False where that can't be settled on a page. Why is said, and added to `not_shown`.
  bool Open(std::vector<ViewFile>& files, std::vector<std::string>& not_shown) {
    std::string said;
    bool is_open = false;
    {
      const CapturedErrors captured;
      is_open = TryToOpen(files);
      said = captured.Text();
    }
    std::cerr << said << std::flush;
    if (!is_open) not_shown.push_back(said.starts_with(kError) ? said.substr(kError.size()) : said);
    return is_open;
  }

  // Or a part of what was chosen is kept.
  bool IsStored() const { return is_stored_; }

 private:
  bool TryToOpen(std::vector<ViewFile>& files) {
    AssetVersions versions;
    if (!stages_.Write(scratch_, versions)) return false;
    if (!versions.HasAsset()) {
      Complain(asset_ + " was merged as text: edit it, and 'git add' it");
      return false;
    }
    ViewFile file = PageFile(versions, settings_, repository_);
    if (!force_ && !ShowHandEdits(versions, settings_, repository_, file)) return false;
    file.store = [this](const std::string&, const std::string& record) { Store(record, false); };
    // What was settled and staged before stays so until it is saved anew.
    if (!stages_.IsStaged()) file.keep = [this](const std::string& record) { Store(record, true); };
    files.push_back(std::move(file));
    return true;
  }

  // Merged once more with what has been decided, as by any other way to settle it.
  void Store(const std::string& record, bool stays_open) {
    if (!stages_.AreSame()) {
      throw std::runtime_error(asset_ +
                               " is no longer in the conflict that it was in when the page was opened");
    }
    OrThrow([&] {
      Choice choice = choice_.Next(record);
      choice.force = force_;
      choice.stays_open = stays_open;
      return Resolving(repository_, settings_, choice).Resolve(asset_);
    });
    choice_.LookAgain();
    is_stored_ = true;
  }

  const Repository& repository_;
  const MergeSettings& settings_;
  const std::string asset_;
  const bool force_;
  const StageFiles stages_;
  PageChoice choice_{asset_};
  bool is_stored_ = false;
  ScratchFolder scratch_{repository_};
};

}  // namespace

int ResolveOnPage(const std::vector<std::string>& arguments) {
  const ResolveArguments parsed = ParseResolve(arguments);
  const ViewServerOptions options = PageOptions(parsed.port, parsed.opens_browser);
  bool is_done = true;
  const std::set<std::string> assets = FindConflicts(parsed, is_done);
  GoToTop();
  if (assets.empty() && parsed.files.empty()) return SayNothingOpen();
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  LoadForPage(settings);
  std::vector<std::unique_ptr<ResolvedFile>> resolved;
  std::vector<ViewFile> files;
  ViewGuide guide;
  for (const std::string& asset : assets) {
    resolved.push_back(std::make_unique<ResolvedFile>(repository, settings, asset, parsed.choice.force));
    if (resolved.back()->Open(files, guide.not_shown)) continue;
    is_done = false;
  }
  if (files.empty()) return 1;
  guide.when_saved = [&] { return AfterAll(FindNextStep(repository)); };
  guide.when_given_up = ToComeBack("vexel-merge-git resolve", parsed.files);
  const int status = ShowPage(std::move(files), options, std::move(guide));
  ConflictRecords(repository).Sweep();
  const bool is_any_stored = std::ranges::any_of(resolved, [](const auto& file) { return file->IsStored(); });
  if (!is_any_stored) Say("Nothing is settled: all is as it was");
  SayNextStep(FindNextStep(repository));
  return is_done ? status : 1;
}

int MergetoolOnPage(const std::vector<std::string>& arguments) {
  const MergetoolCall call = ParseMergetool(arguments);
  const AssetVersions& versions = call.versions;
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  LoadForPage(settings);
  PageChoice choice(versions.asset);
  ViewFile file = PageFile(versions, settings, repository);
  if (!ShowHandEdits(versions, settings, repository, file)) return 1;
  file.store = [&](const std::string&, const std::string& record) {
    OrThrow([&] { return SettleForMergetool(call, choice.Next(record)) == AssetMerge::kMerged; });
  };
  ViewGuide guide;
  guide.when_saved = [&] { return AfterOne(FindStepAfterMergetool(repository, versions.asset, call.last)); };
  guide.when_given_up = ToComeBack("git mergetool", {versions.asset});
  const int status = ShowPage({file}, PageOptions({}, true), std::move(guide));
  if (status != 0)
    Say("Nothing is saved: " + versions.asset +
        " is as it was. To settle it later: " + guide.when_given_up.command);
  return status;
}

}  // namespace vexel_yaml
