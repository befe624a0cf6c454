#include "git/check.h"

#include <algorithm>
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
#include "git/settled_by_hand.h"
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
  ProgramCall call = GitCall({"--literal-pathspecs", "ls-files", "-z", "--full-name", "--cached", "--others",
                              "--exclude-standard", "--error-unmatch", "--"});
  call.arguments.insert(call.arguments.end(), paths.begin(), paths.end());
  const ProgramResult files = Ask(call);
  // Git has said which one isn't there.
  if (files.status != 0) throw CommandError("");
  const Paths found = Pieces(files.output, '\0');
  const std::set<std::string> once(found.begin(), found.end());
  return OursAmong(Paths(once.begin(), once.end()), TopFolder());
}

class Check {
 public:
  explicit Check(bool conflicts_only) : conflicts_only_(conflicts_only) {}

  bool IsClean() const { return is_clean_; }

  void Staged() {
    const auto staged = StagedChanges();
    const std::vector<RecordEntry> entries = records_.Entries();
    const auto in_conflict = entries.empty() ? ConflictPaths() : PathsInConflict(true);
    if (!in_conflict) throw CommandError("", kGitRefused);
    for (const RecordEntry& entry : entries) {
      // What stays as ours has it is no change, but may be what nobody has settled.
      const bool is_part = staged.contains(entry.asset) || in_conflict->staged.contains(entry.asset);
      if (is_part) ReportStaged(entry);
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
    if (parents.size() < CountParents(commit)) return MissHistory(name);
    if (parents.size() == 2) CheckMerge(name, parents, commit);
    if (conflicts_only_) return;
    const Paths changed = parents.empty()
                              ? Pieces(Answer(GitCall({"ls-tree", "-r", "-z", "--name-only", commit})), '\0')
                              : ChangedPaths(parents.front(), commit, {});
    for (const std::string& asset : OursAmong(changed)) {
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
      RecordEntry entry = records_.Entry(asset);
      if (!in_conflict->unmerged.contains(asset)) {
        ReportStaged(entry);
      } else if (entry.conflicts.empty()) {
        Unmerged(asset);
      } else {
        const std::string text = TextOf("./" + asset);
        const std::string merged = records_.MergedText(asset);
        if (!merged.empty() && text != merged) records_.MarkSettledByHand(entry, text, settings_);
        Report(entry, " has ");
      }
      if (!conflicts_only_) ReportFaults(asset, TextOf("./" + asset), {TextAt("HEAD:" + asset)});
    }
  }

 private:
  static std::string TextAt(const std::string& object) {
    return GitQuietly({"cat-file", "blob", object}).output;
  }

  // Those that the commit itself names, which a shallow clone may lack.
  static size_t CountParents(const std::string& commit) {
    const Paths lines = Pieces(Answer(GitCall({"cat-file", "commit", commit})), '\n');
    return static_cast<size_t>(
        std::count_if(lines.begin(), std::ranges::find(lines, ""),
                      [](const std::string& line) { return line.starts_with("parent "); }));
  }

  void MissHistory(const std::string& commit) {
    is_clean_ = false;
    Complain("what " + commit + " comes from is not in this shallow clone; 'git fetch --unshallow' gets it");
  }

  void CheckMerge(const std::string& name, const Paths& parents, const std::string& commit) {
    const Paths bases = Pieces(GitQuietly({"merge-base", "--all", parents[0], parents[1]}).output, '\n');
    if (bases.empty() && Line(Git({"rev-parse", "--is-shallow-repository"})) == "true") {
      return MissHistory(name);
    }
    if (bases.size() > 1) {
      Say("warning: the parents of " + name +
          " have several common ancestors, so it can't be told what was settled in it");
    }
    if (bases.size() == 1) Undecided(FindMerged(commit));
  }

  void ReportStaged(RecordEntry entry) {
    if (entry.asset.empty()) return;
    const auto blobs = IndexBlobs({entry.asset}, true);
    if (!blobs) throw CommandError("", kGitRefused);
    const auto blob = blobs->find(entry.asset);
    if (blob == blobs->end()) {
      // Both sides have renamed it, and each of the new names has what the merge left.
      for (const auto& [path, staged] : StagedChanges()) {
        if (staged == entry.hash) Report({path, {}, {}, entry.conflicts, {}}, " is staged with ");
      }
      return;
    }
    if (blob->second != entry.hash) records_.MarkSettledByHand(entry, TextAt(blob->second), settings_);
    Report(entry, " is staged with ");
  }

  // What a merge commit has as the merge left it.
  void Undecided(const MergedCommits& merged) {
    ScratchFolder scratch;
    for (const std::string& asset : OursAmong(ChangedOnBothSides(merged, {}))) {
      AssetVersions versions;
      const bool are_complete = WriteVersions(merged, asset, scratch, versions);
      if (versions.left.empty() || versions.right.empty() || !versions.HasAsset()) continue;
      AssetMerge merge(versions);
      if (!are_complete || merge.RunQuietly(settings_) == AssetMerge::kFailed) {
        ReportUnmerged(merged, asset);
        continue;
      }
      if (!merge.HasConflicts()) continue;
      RecordEntry entry = {asset, {}, {}, ConflictsAfter(merge, asset, {}, {}), {}};
      const auto sides = [&] { return SideTexts{TextOf(versions.base), TextOf(versions.left)}; };
      MarkSettledByHand(merge.GetText(), TextAt(merged.commit + ":" + asset), settings_, sides,
                        entry.conflicts);
      if (IsSettled(entry)) continue;
      Complain(asset + " stands in this commit as the merge left it, at " +
               CountOfConflicts(entry.CountPending()));
    }
  }

  // What could not be merged was made by hand, or left as it was.
  void ReportUnmerged(const MergedCommits& merged, const std::string& asset) {
    if (TextAt(merged.commit + ":" + asset) != TextAt(merged.ours + ":" + asset)) return;
    is_clean_ = false;
    Complain(asset + " could not be merged, and stands in this commit as ours had it");
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
    Report({asset, {}, {}, ConflictsAfter(merge, asset, {}, {}), {}}, " has ");
  }

  void Report(const RecordEntry& entry, const std::string& state) {
    if (!IsSettled(entry)) Complain(entry.asset + state + Unsettled(entry));
  }

  // Lists the conflicts that aren't.
  bool IsSettled(const RecordEntry& entry) {
    if (entry.CountPending() == 0) return true;
    is_clean_ = false;
    TellConflicts(entry.asset, entry.conflicts);
    return false;
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
