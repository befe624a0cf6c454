#include "app/merge_pipeline.h"

#include <array>
#include <cerrno>
#include <deque>
#include <iostream>
#include <memory>
#include <optional>
#include <string_view>
#include <system_error>
#include <vector>

#include "app/premerge.h"
#include "fixups/post_process.h"
#include "fixups/three_way_merge.h"
#include "merge/conflict_record_file.h"
#include "platform/error_channel.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/keep_until_exit.h"
#include "platform/progress.h"
#include "platform/run_main.h"
#include "platform/thread.h"
#include "platform/timer_stat.h"
#include "rules/setup.h"
#include "rules/yaml_sequence_remapper.h"
#include "scene/safe_merge.h"
#include "scene/unmatched_choices.h"
#include "yaml/write_objects.h"

namespace vexel_yaml {

namespace {

struct KeptDocuments {
  SceneDocuments read;
  std::unique_ptr<VexelObjects> merged;
  std::array<PremergeTarget, 2> premerged;
};

// One run of the merge command, step by step.
class MergeRun {
 public:
  MergeRun(const MergeConfig& config, KeptDocuments& documents, TimerStat& timer)
      : config_(config),
        documents_(documents.read),
        merged_(documents.merged),
        premerged_(documents.premerged),
        timer_(timer),
        // Whoever asks for times is shown the same steps for every file.
        threads_(config.threads &&
                 (config.timing || AreWorthThreads({config.base_path, config.left_path, config.right_path}))),
        resolver_(static_cast<MergeResolve>(config.resolve_mode)) {}

  void Read() {
    ReadMergeDocuments(config_.base_path, config_.left_path, config_.right_path, documents_, threads_,
                       timer_);
  }

  void CreateMappings() {
    TimerStat step(timer_, "Creating mappings");
    TimerStat preprocessing(step, "Preprocess mappings");
    PrepareForDiff(documents_.base, documents_.left, documents_.right);
  }

  void CreateDiffs() {
    TimerStat step(timer_, "Creating diffs");
    diffs_ = CreateDiffPair({documents_.base, documents_.left}, {documents_.base, documents_.right}, threads_,
                            step);
  }

  // False when the file can't be opened, which has been reported.
  bool ReadResolutions() {
    if (config_.merge_file.empty()) return true;
    TimerStat step(timer_, "Reading resolve file");
    if (InputConflictRecords(config_.merge_file, resolver_)) return true;
    const std::string reason = std::generic_category().message(errno);
    errs << "Couldn't open merge resolve file '" << config_.merge_file << "'";
    ErrMsg(errs);
    WriteHint(reason);
    return false;
  }

  void Merge() {
    merged_ = MergeIntoCopy(documents_.base, diffs_, resolver_, timer_);
    TimerStat step(timer_, "Post process merged changes");
    breaks_dependency_ = PostProcess(*merged_, documents_.left, documents_.right, resolver_);
  }

  void ReadSceneDocuments() {
    ReadScenes(config_.base_path, config_.left_path, config_.right_path, documents_, threads_, timer_);
    if (!MayPremerge()) return;
    for (PremergeTarget& target : premerged_) target.versions = documents_.Copy();
  }

  void MergeScenes() {
    SafeMergeResult result = SafeMerge(documents_, resolver_, {.threads = threads_}, timer_);
    for (const SceneNote& note : result.notes) WriteErrorLine(note.text);
    merged_ = std::move(result.merged);
    breaks_dependency_ = result.breaks_dependency;
    for (const std::string& line : DescribeUnmatchedChoices(resolver_, *merged_)) WriteErrorLine(line);
  }

  void OutputConflicts() {
    TimerStat step(timer_, "Output conflicts");
    if (config_.conflict_file.empty()) {
      OutputConflictRecords(std::cout, resolver_, config_.describe);
      if (!std::cout.flush()) throw FileError(FileError::Step::kWriting, "standard output", errno);
      return;
    }
    FileReplacement& file = others_.emplace_back(VexelToNativePath(config_.conflict_file));
    OutputConflictRecords(file.Stream(), resolver_, config_.describe);
    file.Finish();
  }

  void OutputResult(const std::string& path_for_tool) {
    TimerStat step(timer_, "Output result");
    const bool tool_follows = GetResult() != 0 && config_.fallback_spec_file != kNoSpecFile;
    const std::string& path = tool_follows ? path_for_tool : config_.destination_path;
    if (path.empty()) {
      // The merge is only a check, which an object that can't be written fails, too.
      std::ostream nowhere(nullptr);
      WriteObjects(*merged_, nowhere, threads_);
      return;
    }
    result_.emplace(VexelToNativePath(path));
    WriteObjects(*merged_, result_->Stream(), threads_);
    result_->Finish();
  }

  void OutputPremerge() {
    if (!resolver_.HasPendingConflicts() || !MayPremerge()) return;
    premerged_[0].side =
        YAMLSequenceRemapper::CheckBlankPremergeBaseEnabled() ? MergeResolve::kBlank : MergeResolve::kBase;
    premerged_[1].side = MergeResolve::kRight;
    RunPremerges(premerged_, documents_, diffs_, resolver_.GetResolutions(), threads_, timer_);
    // One after the other: two at once may be more than the descriptors that are left.
    Write(config_.premerge_base_destination, premerged_[0].text.view());
    Write(config_.premerge_right_destination, premerged_[1].text.view());
  }

  // Not before all of them are on the disk: a merge that fails leaves no file of a merge. The result comes
  // last, since version control goes by it.
  void CommitFiles() {
    for (FileReplacement& file : others_) file.Commit();
    if (result_) result_->Commit();
  }

  int GetResult() const {
    if (!resolver_.HasPendingConflicts()) return 0;
    return breaks_dependency_ ? 3 : 2;
  }

 private:
  bool MayPremerge() const {
    return !config_.premerge_base_destination.empty() && !config_.premerge_right_destination.empty();
  }

  void Write(const std::string& path, std::string_view text) {
    FileReplacement& file = others_.emplace_back(VexelToNativePath(path));
    file.Stream() << text;
    file.Finish();
  }

  const MergeConfig& config_;
  SceneDocuments& documents_;
  std::unique_ptr<VexelObjects>& merged_;
  std::array<PremergeTarget, 2>& premerged_;
  TimerStat& timer_;
  const bool threads_;
  DiffPair diffs_;
  RecordingConflictResolver resolver_;
  bool breaks_dependency_ = false;
  // Finished files that wait to take their places.
  std::deque<FileReplacement> others_;
  std::optional<FileReplacement> result_;
};

}  // namespace

int HandleMergeCommand(const MergeConfig& config, const std::string& path_for_tool) {
  TimerStat timer("Merge Command", config.timing ? &std::cout : nullptr);
  const Progress progress("Merging " +
                          (config.destination_path.empty() ? config.base_path : config.destination_path));
  SetupRulesAndTypes(config.rules_file, config.type_info_file, timer);
  MergeRun run(config, KeepUntilExit(std::make_unique<KeptDocuments>()), timer);
  Progress::Step("reading");
  if (config.safe) {
    run.ReadSceneDocuments();
  } else {
    run.Read();
    run.CreateMappings();
    run.CreateDiffs();
  }
  if (!run.ReadResolutions()) return 1;
  Progress::Step("merging");
  if (config.safe) {
    run.MergeScenes();
  } else {
    run.Merge();
  }
  run.OutputConflicts();
  Progress::Step("writing");
  run.OutputResult(path_for_tool);
  run.OutputPremerge();
  // The last that can fail before the destination changes.
  if (!FlushStandardOutput()) return 1;
  run.CommitFiles();
  return run.GetResult();
}

}  // namespace vexel_yaml
