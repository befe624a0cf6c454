#include "git/merge_driver.h"

#include <fcntl.h>
#include <unistd.h>

#include "git/asset_merge.h"
#include "git/conflict_messages.h"
#include "git/conflict_records.h"
#include "git/decided_lines.h"
#include "git/decision_memory.h"
#include "git/git_call.h"
#include "git/repository.h"
#include "git/settings.h"
#include "git/shown_text.h"
#include "git/undecided_places.h"
#include "git/work_files.h"
#include "platform/file_error.h"
#include "platform/keep_until_exit.h"
#include "platform/progress.h"
#include "report/report_command.h"

namespace vexel_yaml {

namespace {

// A file on its way through the driver.
class DriverRun {
 public:
  DriverRun(AssetVersions versions, std::string marker_size, bool is_ancestor)
      : versions_(std::move(versions)), marker_size_(std::move(marker_size)), is_ancestor_(is_ancestor) {}

  int Run() {
    // Who waits for the merge of many files waits since the first one of them.
    const Progress progress("Merging " + versions_.asset, Progress::kPatience - repository_.TimeAtWork());
    try {
      return Merge();
    } catch (const FileError& error) {
      Complain(error.what());
    } catch (const CommandError& error) {
      if (*error.what() != '\0') Complain(error.what());
    }
    return LeaveUnmerged();
  }

 private:
  int Merge() {
    // Git answers while the files are looked at.
    SettingsQuery query;
    MarkUndecided(versions_);
    keeps_records_ = !is_ancestor_ && repository_.IsChanging();
    const bool is_ours = versions_.HasAsset();
    merge_ = &KeepUntilExit(std::make_unique<AssetMerge>(versions_));
    if (is_ours) merge_->Read();
    settings_ = query.Get();
    if (!is_ours) {
      RemoveRecord();
      return MergeAsText();
    }
    int status = merge_->Run(settings_);
    if (status > AssetMerge::kFailed && !is_ancestor_) status = DecideAsBefore(status);
    const bool is_to_confirm = status == AssetMerge::kMerged && !entry_.conflicts.empty() && keeps_records_ &&
                               !settings_.stages_remembered;
    const bool is_done = status == AssetMerge::kMerged && !is_to_confirm;
    // Where that can't be, nothing is merged.
    if (is_done) RemoveRecord();
    if (status != AssetMerge::kFailed && !PutMerged()) {
      Complain("cannot write the merged " + versions_.asset);
      status = AssetMerge::kFailed;
    }
    if (status == AssetMerge::kFailed) return LeaveUnmerged();
    if (!is_done && !is_ancestor_) TellConflicts();
    return is_to_confirm ? AssetMerge::kConflicts : status;
  }

  bool PutMerged() const {
    return PutFile(versions_.right,
                   is_ancestor_ ? WithUndecidedPlaces(*merge_, versions_) : merge_->GetText());
  }

  // Names the conflicts, and merges once more with what was decided when they came before.
  int DecideAsBefore(int status) {
    entry_ = {versions_.asset, {}, FindSideNames(repository_), {}, {}};
    entry_.conflicts = ConflictsAfter(*merge_, versions_.asset, entry_.names, {});
    if (!settings_.remembers_decisions) return status;
    const std::vector<std::string> lines = DecisionMemory(repository_).Recall(entry_.conflicts);
    if (lines.empty()) return status;
    auto* again = new AssetMerge(versions_);
    const Decisions decisions = {DecidedIn({}, lines), {}};
    const int new_status = again->RunQuietly(settings_, &decisions);
    if (new_status == AssetMerge::kFailed) return status;
    merge_ = again;
    entry_.conflicts = ConflictsAfter(*merge_, versions_.asset, entry_.names, entry_.conflicts);
    Say(CountOfConflicts(lines.size()) + " of " + versions_.asset + " settled as before");
    return new_status;
  }

  void RemoveRecord() {
    if (keeps_records_) records_.Remove(versions_.asset);
  }

  // Git does what it does without us to files that are none of ours, but bear their names.
  int MergeAsText() {
    // Its status is the number of conflicts, up to 127.
    const int status =
        RunProgram(QuietCall({"merge-file", "-q", "--marker-size=" + marker_size_, "-L", "ours", "-L", "base",
                              "-L", "theirs", versions_.right, versions_.base, versions_.left}))
            .status;
    // Git would take a status above 128 for a driver that was killed, and give up.
    if (status > 127) Complain(versions_.asset + " can't be merged, not even as text");
    return status == 0 ? 0 : 1;
  }

  int LeaveUnmerged() {
    if (is_ancestor_) {
      // Ours as the ancestor of both sides would make what theirs did look undone, and drop it.
      PutFile(versions_.right, TextOf(versions_.base));
      return AssetMerge::kFailed;
    }
    Say(versions_.asset + " is not merged, but left as ours has it; to take it so: " +
        ResolveCall(versions_.asset, "resolve --as-is") + ", or theirs: git checkout --theirs, and git add");
    if (keeps_records_) GuardUnmerged();
    return AssetMerge::kFailed;
  }

  void GuardUnmerged() {
    const RecordEntry entry = {versions_.asset,
                               {},
                               FindSideNames(repository_),
                               {{{}, "not merged, but left as ours has it", {}, false}},
                               {}};
    const auto hash = [&] { return HashIn(RunProgram(HashCall(versions_.asset, TextOf(versions_.right)))); };
    try {
      if (records_.LeaveUnmerged(entry, hash, settings_)) return;
    } catch (const std::runtime_error& error) {
      Complain(error.what());
    }
    Complain("cannot write the record of " + versions_.asset);
  }

  // The merge goes on whatever fails here.
  void TellConflicts() {
    SayConflicts(versions_.asset, entry_.conflicts);
    try {
      if (keeps_records_) LeaveRecord();
    } catch (const std::runtime_error& error) {
      Complain("cannot write the record of " + versions_.asset + ": " + error.what());
    }
  }

  void LeaveRecord() {
    // Git answers while it is asked other things.
    Program hash(HashCall(versions_.asset, merge_->GetText()));
    const std::string record = records_.Leave(
        entry_, *merge_, merge_->GetText(), [&] { return HashIn(hash.Wait()); }, settings_);
    if (record.empty()) {
      Complain("cannot write the record of " + versions_.asset);
    } else if (entry_.CountPending() > 0) {
      Say(CountOfConflicts(entry_.CountPending()) + ", listed in " + ShownRecord(record) +
          "; to settle: " + ResolveCall(versions_.asset));
    } else {
      Say("To take it so, 'git add' " + versions_.asset +
          "; to settle otherwise: " + ResolveCall(versions_.asset));
    }
  }

  AssetVersions versions_;
  const std::string marker_size_;
  const bool is_ancestor_;
  const Repository repository_;
  const ConflictRecords records_{repository_};
  MergeSettings settings_;
  bool keeps_records_ = false;
  AssetMerge* merge_ = nullptr;
  RecordEntry entry_;
};

void CloseStandardError() {
  const int nowhere = open("/dev/null", O_WRONLY | O_CLOEXEC);
  if (nowhere < 0) return;
  dup2(nowhere, STDERR_FILENO);
  close(nowhere);
}

}  // namespace

int RunMergeDriver(std::vector<std::string> arguments) {
  const bool is_ancestor = !arguments.empty() && arguments.front() == "--ancestor";
  if (is_ancestor) arguments.erase(arguments.begin());
  if (arguments.size() != 5) throw WrongUsage("merge-driver is called by git");
  // What can't be done with an ancestor is for the merge itself to tell.
  if (is_ancestor) CloseStandardError();
  const AssetVersions versions = {arguments[4], arguments[0], arguments[2], arguments[1]};
  return DriverRun(versions, arguments[3], is_ancestor).Run();
}

int RunTextconv(const std::vector<std::string>& arguments) {
  if (arguments.empty()) throw WrongUsage("textconv is called by git");
  return RunReport({"vexel-merge-report", "--text", "--", arguments.back()});
}

}  // namespace vexel_yaml
