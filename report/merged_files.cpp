#include "report/merged_files.h"

#include <new>

#include "fixups/post_process.h"
#include "fixups/state_machine_transitions.h"
#include "merge/conflict_record_file.h"
#include "platform/error_channel.h"
#include "platform/hinted_error.h"
#include "platform/thread.h"
#include "report/shown_diff.h"
#include "rules/setup.h"
#include "scene/safe_merge.h"
#include "scene/unmatched_choices.h"

namespace vexel_yaml {

namespace {

std::string WithHint(const std::string& message, const std::string& hint) {
  return hint.empty() ? message : message + " (" + hint + ")";
}

// What is still folded was not edited, and has no hash that could be out of date.
void RebuildHashesOfRead(VexelObjects& objects) {
  for (const YAMLMapping::Slot& slot : objects) {
    if (GetFolded(slot.value) == nullptr) slot.value->RebuildHash(false);
  }
  objects.RebuildHash(true);
}

struct Merged {
  std::unique_ptr<VexelObjects> unrepaired;
  std::unique_ptr<VexelObjects> repaired;
};

Merged MergeValues(MergedFiles& files, TimerStat& timer) {
  const auto& [base, left, right] = static_cast<const MergeDocuments&>(files.read);
  Merged merged;
  merged.repaired = MergeIntoCopy(base, files.diffs, files.resolver, timer);
  merged.unrepaired.reset(merged.repaired->Clone());
  PostProcess(*merged.repaired, left, right, files.resolver);
  // Mappings with repeated keys can't be compared.
  TransitionsToSequences(*merged.repaired);
  return merged;
}

Merged MergeScenes(MergedFiles& files, TimerStat& timer) {
  files.settled = files.untouched.Copy();
  SafeMergeResult result = SafeMerge(*files.settled, files.resolver, {.keep_comparable = true}, timer);
  files.notes = std::move(result.notes);
  return {std::move(result.unrepaired), std::move(result.repaired)};
}

void Merge(MergedFiles& files) {
  TimerStat timer("", nullptr);
  Merged merged = files.safe ? MergeScenes(files, timer) : MergeValues(files, timer);
  // Neither can nodes whose hashes are out of date.
  RebuildHashesOfRead(*merged.repaired);
  RebuildHashesOfRead(*merged.unrepaired);
  files.unrepaired = std::move(merged.unrepaired);
  files.merged = std::move(merged.repaired);
}

}  // namespace

void ReadVersions(const ReportConfig& config, SceneDocuments& documents) {
  TimerStat silent("", nullptr);
  const bool threads = AreWorthThreads({config.base_path, config.left_path, config.right_path});
  if (config.safe) {
    ReadScenes(config.base_path, config.left_path, config.right_path, documents, threads, silent);
  } else {
    ReadMergeDocuments(config.base_path, config.left_path, config.right_path, documents, threads, silent);
    documents.renumbered = PrepareForDiff(documents.base, documents.left, documents.right);
  }
}

namespace {

// The places in its lists are to count from base, as those of the result do.
void ReadCommitted(ReportConfig config, MergedFiles& files) {
  config.left_path = config.committed_path;
  config.right_path = config.base_path;
  files.committed = std::make_unique<SceneDocuments>();
  ReadVersions(config, *files.committed);
}

}  // namespace

void CompareVersions(MergedFiles& files, bool threads) {
  TimerStat silent("", nullptr);
  files.untouched.CopyTo(files.read);
  const auto& [base, left, right] = static_cast<const MergeDocuments&>(files.read);
  if (files.safe) {
    files.diffs = {DiffToShow(base, left), DiffToShow(base, right)};
  } else {
    files.diffs = CreateDiffPair({base, left}, {base, right}, threads, silent);
  }
}

std::vector<RecordingConflictResolver::RecordResolve> ReadResolutions(const std::string& path) {
  RecordingConflictResolver reader(MergeResolve::kBase);
  if (!InputConflictRecords(path, reader)) {
    throw YAMLError("Couldn't open merge resolve file '" + path + "'");
  }
  return reader.GetResolutions();
}

void MergeRead(MergedFiles& files, std::vector<RecordingConflictResolver::RecordResolve> resolutions) {
  files.unrepaired = nullptr;
  files.merged = nullptr;
  files.error.clear();
  files.notes.clear();
  files.resolver = RecordingConflictResolver(MergeResolve::kBase);
  files.resolver.SetResolveMethodForPaths(std::move(resolutions));
  // What both sides did is worth a look all the same where the merge fails.
  try {
    Merge(files);
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const YAMLError& error) {
    files.error = Explained(error);
  } catch (const std::exception& error) {
    files.error = Explained(error);
  }
}

void MergeForReport(const ReportConfig& config, MergedFiles& files) {
  TimerStat silent("", nullptr);
  SetupRulesAndTypes(config.rules_file, config.type_info_file, silent);
  files.safe = config.safe;
  ReadVersions(config, files.untouched);
  CompareVersions(files, AreWorthThreads({config.base_path, config.left_path, config.right_path}));
  if (!config.committed_path.empty()) ReadCommitted(config, files);
  std::vector<RecordingConflictResolver::RecordResolve> resolutions;
  if (!config.merge_file.empty()) resolutions = ReadResolutions(config.merge_file);
  MergeRead(files, std::move(resolutions));
  if (!config.safe || files.merged == nullptr) return;
  for (const std::string& line : DescribeUnmatchedChoices(files.resolver, *files.merged))
    WriteErrorLine(line);
}

std::string Explained(const YAMLError& error) { return WithHint(error.what(), error.GetHint()); }

std::string Explained(const std::exception& error) {
  const auto* hinted = dynamic_cast<const HintedError*>(&error);
  return WithHint(error.what(), hinted == nullptr ? "" : hinted->GetHint());
}

}  // namespace vexel_yaml
