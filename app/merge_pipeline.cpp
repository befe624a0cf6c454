#include "app/merge_pipeline.h"

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <memory>
#include <system_error>
#include <vector>

#include "app/diffing.h"
#include "app/premerge.h"
#include "app/reading.h"
#include "app/setup.h"
#include "app/writing.h"
#include "diff/yaml_mapping_diff.h"
#include "fixups/duplicate_keys.h"
#include "fixups/file_id_collisions.h"
#include "fixups/post_process.h"
#include "fixups/state_machine_transitions.h"
#include "merge/conflict_record_file.h"
#include "platform/error_channel.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/timer_stat.h"
#include "rules/yaml_sequence_remapper.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

namespace {

// What is kept until the process ends: giving back the nodes of three scenes one by one would take as long as
// merging them.
struct KeptDocuments {
  MergeDocuments read;
  std::unique_ptr<VexelObjects> merged;
};

KeptDocuments& NewKeptDocuments() {
  static auto& kept = *new std::vector<std::unique_ptr<KeptDocuments>>;
  return *kept.emplace_back(std::make_unique<KeptDocuments>());
}

// One run of the merge command, step by step.
class MergeRun {
 public:
  MergeRun(const MergeConfig& config, KeptDocuments& documents, TimerStat& timer)
      : config_(config),
        documents_(documents.read),
        merged_(documents.merged),
        timer_(timer),
        resolver_(static_cast<MergeResolve>(config.resolve_mode)) {}

  void Read() {
    const std::vector<FileToRead> files = {{"Read base", config_.base_path, documents_.base},
                                           {"Read left", config_.left_path, documents_.left},
                                           {"Read right", config_.right_path, documents_.right}};
    ReadFiles(files, config_.threads, timer_);
    for (const FileToRead& file : files) RefuseDuplicateKeys(file.objects, file.path);
  }

  void CreateMappings() {
    TimerStat step(timer_, "Creating mappings");
    TimerStat preprocessing(step, "Preprocess mappings");
    for (VexelObjects* objects : {&documents_.base, &documents_.left, &documents_.right}) {
      TransitionsToSequences(*objects);
    }
    RemapCollidingAddFileIDs(FindCollidingAdditions(documents_.base, documents_.left, documents_.right),
                             documents_.base, documents_.left, documents_.right);
  }

  void CreateDiffs() {
    TimerStat step(timer_, "Creating diffs");
    diffs_ = CreateDiffPair({documents_.base, documents_.left}, {documents_.base, documents_.right},
                            config_.threads, step);
  }

  // False when the file can't be opened, which has been reported.
  bool ReadResolutions() {
    if (config_.merge_file.empty()) return true;
    TimerStat step(timer_, "Reading resolve file");
    std::error_code error;
    std::ifstream file(VexelToNativePath(config_.merge_file));
    if (!file || std::filesystem::is_directory(config_.merge_file, error)) {
      errs << "Couldn't open merge resolve file '" << config_.merge_file << "'";
      ErrMsg(errs);
      return false;
    }
    InputConflictRecords(file, resolver_);
    return true;
  }

  void Merge() {
    const YAMLMappingDiff* merged_diff = nullptr;
    {
      TimerStat step(timer_, "Merging");
      merged_diff = YAMLMappingDiff::Merge(*diffs_.left, *diffs_.right, resolver_);
    }
    {
      TimerStat step(timer_, "Cloning base roots");
      merged_.reset(documents_.base.Clone());
    }
    {
      TimerStat step(timer_, "Applying merged changes");
      merged_diff->Apply(*merged_);
    }
    TimerStat step(timer_, "Post process merged changes");
    breaks_dependency_ = PostProcess(*merged_, documents_.left, documents_.right, resolver_);
  }

  void OutputConflicts() {
    TimerStat step(timer_, "Output conflicts");
    if (config_.conflict_file.empty()) {
      OutputConflictRecords(std::cout, resolver_, config_.describe);
      if (!std::cout.flush()) throw FileError("standard output", errno);
      return;
    }
    FileReplacement file(VexelToNativePath(config_.conflict_file));
    OutputConflictRecords(file.Stream(), resolver_, config_.describe);
    file.Commit();
  }

  void OutputResult(const std::string& path) {
    TimerStat step(timer_, "Output result");
    FileReplacement file(VexelToNativePath(path));
    WriteObjects(*merged_, file.Stream(), config_.threads);
    file.Commit();
  }

  void OutputPremerge() {
    if (!resolver_.HasPendingConflicts() || config_.premerge_base_destination.empty() ||
        config_.premerge_right_destination.empty()) {
      return;
    }
    const MergeResolve base_side =
        YAMLSequenceRemapper::CheckBlankPremergeBaseEnabled() ? MergeResolve::kBlank : MergeResolve::kBase;
    RunPremerges({{{base_side, config_.premerge_base_destination},
                   {MergeResolve::kRight, config_.premerge_right_destination}}},
                 documents_, diffs_, resolver_.GetResolutions(), config_.threads, timer_);
  }

  int GetResult() const {
    if (!resolver_.HasPendingConflicts()) return 0;
    return breaks_dependency_ ? 3 : 2;
  }

 private:
  const MergeConfig& config_;
  MergeDocuments& documents_;
  std::unique_ptr<VexelObjects>& merged_;
  TimerStat& timer_;
  DiffPair diffs_;
  RecordingConflictResolver resolver_;
  bool breaks_dependency_ = false;
};

}  // namespace

int HandleMergeCommand(const MergeConfig& config, const std::string& output_path) {
  TimerStat timer("Merge Command", config.timing ? &std::cout : nullptr);
  SetupRulesAndTypes(config.rules_file, config.type_info_file, timer);
  MergeRun run(config, NewKeptDocuments(), timer);
  run.Read();
  run.CreateMappings();
  run.CreateDiffs();
  if (!run.ReadResolutions()) return 1;
  run.Merge();
  run.OutputConflicts();
  run.OutputResult(output_path);
  run.OutputPremerge();
  return run.GetResult();
}

}  // namespace vexel_yaml
