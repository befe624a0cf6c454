#include "git/preview.h"

#include <algorithm>

#include "git/conflict_messages.h"
#include "git/git_call.h"
#include "git/merged_commits.h"
#include "git/settings.h"
#include "git/shown_text.h"
#include "platform/progress.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

using Names = std::vector<std::string>;

class Preview {
 public:
  Preview(MergedCommits merged, std::string branch)
      : merged_(std::move(merged)), branch_(std::move(branch)) {}

  // Returns whether it would have conflicts, or fail.
  bool Tell(const std::string& asset) {
    const Progress progress("Looking at " + asset);
    AssetVersions versions;
    if (!WriteVersions(merged_, asset, scratch_, versions)) {
      vexel_yaml::Tell(asset + ": not in all three versions; git asks which one is to stay");
      return true;
    }
    if (!versions.HasAsset()) {
      vexel_yaml::Tell(asset + ": would be merged as text");
      return false;
    }
    AssetMerge merge(versions);
    merge.ListEdits();
    const int status = merge.Run(settings_);
    const auto conflicts = status == AssetMerge::kFailed ? std::vector<RecordedConflict>()
                                                         : ConflictsAfter(merge, asset, {branch_, {}}, {});
    vexel_yaml::Tell(asset + ": " +
                     (status == AssetMerge::kFailed ? "can't be merged"
                      : conflicts.empty()           ? "merges without conflicts"
                                                    : CountOfConflicts(conflicts.size())));
    TellSide("theirs", merged_.theirs, asset, merge.GetEdits().theirs);
    TellSide("ours", merged_.ours, asset, merge.GetEdits().ours);
    TellConflicts(asset, conflicts);
    return status != AssetMerge::kMerged;
  }

 private:
  void TellSide(const std::string& side, const std::string& commit, const std::string& asset,
                const Names& objects) {
    const std::string edits = objects.empty() ? std::string() : ": " + ListOf(objects);
    vexel_yaml::Tell("  " + side + ", by " +
                     ListOf(Authors(merged_.base + ".." + commit, {asset, OldName(merged_, asset)})) + edits);
  }

  const MergedCommits merged_;
  const std::string branch_;
  const MergeSettings settings_ = SettingsQuery().Get();
  ScratchFolder scratch_;
};

// Nothing where there would be no merge, which has been said.
bool FindSides(const std::string& branch, MergedCommits& merged) {
  merged = {{}, {}, FindCommit("HEAD"), FindCommit(branch)};
  const Names bases = Pieces(Git({"merge-base", "--all", merged.ours, merged.theirs}).output, '\n');
  if (bases.empty()) throw CommandError("there is no common ancestor with " + branch);
  merged.base = bases.front();
  if (bases.size() > 1) {
    Say("warning: there are several common ancestors, which git merges first; this is what one of them makes "
        "of it");
  }
  if (merged.base == merged.theirs) Tell("Nothing to merge: all of " + branch + " is here already.");
  if (merged.base == merged.ours && merged.base != merged.theirs) {
    Tell("Nothing to merge: " + branch + " only goes on from here.");
  }
  FindRenamed(merged);
  return merged.base != merged.theirs && merged.base != merged.ours;
}

}  // namespace

int RunPreview(const std::vector<std::string>& arguments) {
  if (arguments.size() != 1 || arguments.front().starts_with('-')) throw WrongUsage("preview needs a branch");
  GoToTop();
  const std::string& branch = arguments.front();
  MergedCommits merged;
  if (!FindSides(branch, merged)) return 0;
  const Names assets = OursAmong(ChangedOnBothSides(merged, {}));
  if (assets.empty()) Tell("No file of ours was changed on both sides.");
  Preview preview(merged, branch);
  bool is_clean = true;
  for (const std::string& asset : assets) is_clean = !preview.Tell(asset) && is_clean;
  return is_clean ? 0 : 1;
}

}  // namespace vexel_yaml
