#include "git/check.h"

#include <set>

#include "git/asset_merge.h"
#include "git/conflict_messages.h"
#include "git/conflict_records.h"
#include "git/git_call.h"
#include "git/index_state.h"
#include "git/merged_commits.h"
#include "git/new_faults.h"
#include "git/repository.h"
#include "git/settings.h"
#include "git/shown_text.h"
#include "git/stage_files.h"
#include "git/work_files.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

using Paths = std::vector<std::string>;

struct Arguments {
  bool is_staged = false;
  bool is_in_rebase = false;
  bool conflicts_only = false;
  std::string commit;
  Paths files;
};

Arguments Parse(const Paths& arguments) {
  Arguments parsed;
  bool is_option = true;
  for (const std::string& argument : arguments) {
    if (!is_option || (!argument.starts_with('-') && FileExists(argument))) {
      parsed.files.push_back(argument);
    } else if (argument == "--") {
      is_option = false;
    } else if (argument == "--staged") {
      parsed.is_staged = true;
    } else if (argument == "--conflicts") {
      parsed.conflicts_only = true;
    } else if (argument == "--in-rebase") {
      parsed.is_in_rebase = true;
    } else if (argument.starts_with('-')) {
      throw WrongUsage("unknown option '" + argument + "'");
    } else if (!parsed.commit.empty()) {
      throw WrongUsage("check takes one commit");
    } else {
      parsed.commit = argument;
    }
  }
  if (parsed.is_staged + !parsed.commit.empty() + !parsed.files.empty() > 1) {
    throw WrongUsage("check takes --staged, a commit, or files");
  }
  return parsed;
}

// The files of ours that the paths mean, from the top folder.
Paths AssetsBelow(const Paths& paths) {
  ProgramCall call = GitCall({"--literal-pathspecs", "ls-files", "-z", "--full-name", "--"});
  call.arguments.insert(call.arguments.end(), paths.begin(), paths.end());
  const Paths found = Pieces(RunProgram(call).output, '\0');
  const std::set<std::string> once(found.begin(), found.end());
  return OursAmong(Paths(once.begin(), once.end()), TopFolder());
}

class Check {
 public:
  explicit Check(bool conflicts_only) : conflicts_only_(conflicts_only) {}

  bool IsClean() const { return is_clean_; }

  void Staged() {
    const auto staged = StagedChanges();
    for (const RecordEntry& entry : records_.Entries()) {
      const auto blob = staged.find(entry.asset);
      if (blob == staged.end() || blob->second != entry.hash) continue;
      Report(entry.asset, entry.conflicts, "staged as the merge left it");
    }
    if (conflicts_only_) return;
    Paths changed;
    for (const auto& [path, blob] : staged) {
      if (!blob.empty()) changed.push_back(path);
    }
    for (const std::string& asset : OursAmong(changed)) {
      ReportFaults(asset, TextAt(staged.at(asset)), {TextAt("HEAD:" + asset)});
    }
  }

  void Commit(const std::string& name) {
    const std::string commit = FindCommit(name);
    Paths parents = Pieces(Line(Git({"rev-list", "--parents", "-n", "1", commit})), ' ');
    parents.erase(parents.begin());
    if (parents.size() == 2) Undecided(FindMerged(commit));
    if (parents.empty() || conflicts_only_) return;
    for (const std::string& asset : OursAmong(ChangedPaths(parents.front(), commit, {}))) {
      Paths before;
      for (const std::string& parent : parents) before.push_back(TextAt(parent + ":" + asset));
      ReportFaults(asset, TextAt(commit + ":" + asset), before);
    }
  }

  // All that are in conflict where none is named.
  void Files(const Paths& named) {
    const auto in_conflict = PathsInConflict();
    if (!in_conflict) throw CommandError("", kGitRefused);
    std::set<std::string> assets(named.begin(), named.end());
    if (named.empty()) {
      for (const std::string& asset :
           OursAmong(Paths(in_conflict->unmerged.begin(), in_conflict->unmerged.end())))
        assets.insert(asset);
      for (const RecordEntry& entry : records_.Entries()) assets.insert(entry.asset);
    }
    for (const std::string& asset : assets) {
      const RecordEntry entry = records_.Entry(asset);
      if (!in_conflict->unmerged.contains(asset)) {
        Report(asset, entry.conflicts, "staged as the merge left it");
      } else if (!entry.conflicts.empty()) {
        Report(asset, entry.conflicts, "in conflict");
      } else {
        Unmerged(asset);
      }
      if (!conflicts_only_) ReportFaults(asset, TextOf("./" + asset), {TextAt("HEAD:" + asset)});
    }
  }

 private:
  static std::string TextAt(const std::string& object) {
    return GitQuietly({"cat-file", "blob", object}).output;
  }

  // What a merge commit has as the merge left it.
  void Undecided(const MergedCommits& merged) {
    ScratchFolder scratch;
    for (const std::string& asset : OursAmong(ChangedOnBothSides(merged, {}))) {
      AssetVersions versions;
      if (!WriteVersions(merged, asset, scratch, versions) || !versions.HasAsset()) continue;
      AssetMerge merge(versions);
      // What could not be merged was made by hand.
      if (merge.RunQuietly(settings_) == AssetMerge::kFailed || !merge.HasConflicts()) continue;
      const ProgramResult blob =
          GitQuietly({"rev-parse", "--verify", "--quiet", merged.commit + ":" + asset});
      if (Line(blob) != Line(RunProgram(HashCall(asset, merge.GetText())))) continue;
      Report(asset, ConflictsAfter(merge, asset, {}, {}), "in this commit as the merge left it");
    }
  }

  void ReportFaults(const std::string& asset, const std::string& text, const Paths& before) {
    for (const std::string& fault : NewFaults(text, before)) {
      is_clean_ = false;
      Complain(asset + " is broken: " + fault);
    }
  }

  // Without a record.
  void Unmerged(const std::string& asset) {
    is_clean_ = false;
    ScratchFolder scratch;
    AssetVersions versions;
    if (!StageFiles(asset).Write(scratch, versions)) return;
    AssetMerge merge(versions);
    if (!versions.HasAsset() || merge.Run(settings_) == AssetMerge::kFailed) {
      Complain(asset + " is in conflict");
      return;
    }
    Report(asset, ConflictsAfter(merge, asset, {}, {}), "in conflict");
  }

  void Report(const std::string& asset, const std::vector<RecordedConflict>& conflicts,
              const std::string& state) {
    const RecordEntry entry = {asset, {}, {}, conflicts, false};
    if (entry.CountPending() == 0) return;
    is_clean_ = false;
    TellConflicts(asset, conflicts);
    Complain(asset + " is " + state + ", with base's values at " + CountOfConflicts(entry.CountPending()) +
             "; to settle: " + ResolveCall(asset) + " (with --base to keep these values)");
  }

  const Repository repository_;
  const MergeSettings settings_ = SettingsQuery().Get();
  const ConflictRecords records_{repository_};
  const bool conflicts_only_;
  bool is_clean_ = true;
};

}  // namespace

int RunCheck(const std::vector<std::string>& arguments) {
  const Arguments parsed = Parse(arguments);
  const Paths assets = parsed.files.empty() ? Paths() : AssetsBelow(parsed.files);
  GoToTop();
  if (parsed.is_in_rebase && !IsFolder(Repository().Path("rebase-merge"))) return 0;
  Check check(parsed.conflicts_only);
  if (parsed.is_staged) {
    check.Staged();
  } else if (!parsed.commit.empty()) {
    check.Commit(parsed.commit);
  } else if (parsed.files.empty() || !assets.empty()) {
    check.Files(assets);
  }
  return check.IsClean() ? 0 : 1;
}

}  // namespace vexel_yaml
