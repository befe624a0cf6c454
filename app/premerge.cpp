#include "app/premerge.h"

#include "fixups/post_process.h"
#include "platform/thread.h"
#include "scene/safe_merge.h"

namespace vexel_yaml {

namespace {

// One premerged file on its way.
struct PremergeJob {
  PremergeTarget& target;
  // A fresh copy of base: one that already holds the merge can't take it again. Null where the target has
  // versions of its own.
  std::unique_ptr<VexelObjects> copy;
};

// What both threads share, read only.
struct PremergeInput {
  const MergeDocuments& documents;
  const DiffPair& diffs;
  const std::vector<RecordingConflictResolver::RecordResolve>& resolutions;
};

void Premerge(MergeResolve side, std::ostream& out, VexelObjects& copy, const PremergeInput& input,
              TimerStat& timer) {
  RecordingConflictResolver resolver(side);
  // What the user has settled is no conflict in any of the files.
  resolver.SetResolveMethodForPaths(input.resolutions);
  const YAMLMappingDiff* diff = nullptr;
  {
    TimerStat step(timer, "Merging premerge");
    diff = YAMLMappingDiff::Merge(*input.diffs.left, *input.diffs.right, resolver);
  }
  {
    TimerStat step(timer, "Applying premerge merged changes");
    diff->Apply(copy);
    PostProcessMergeOnly(copy, input.documents.left, input.documents.right, resolver);
  }
  TimerStat step(timer, "Output premerge result");
  copy.Output(out, VexelObjects::Headers::kAsTheyAre);
}

void PremergeScene(PremergeTarget& target, const PremergeInput& input, TimerStat& timer) {
  RecordingConflictResolver resolver(target.side);
  resolver.SetResolveMethodForPaths(input.resolutions);
  TimerStat step(timer, "Merging premerge");
  SafeMerge(*target.versions, resolver, {.threads = false}, step)
      .merged->Output(target.text, VexelObjects::Headers::kAsTheyAre);
}

void PremergeThreadFunction(PremergeJob& job, const PremergeInput& input, TimerStat& timer) {
  if (job.target.versions != nullptr) {
    PremergeScene(job.target, input, timer);
    return;
  }
  Premerge(job.target.side, job.target.text, *job.copy, input, timer);
}

void SpawnPremergeThread(Thread& thread, PremergeJob& job, const PremergeInput& input, TimerStat& timer) {
  thread.Start([&] { PremergeThreadFunction(job, input, timer); });
}

}  // namespace

void RunPremerges(std::array<PremergeTarget, 2>& targets, const MergeDocuments& documents,
                  const DiffPair& diffs,
                  const std::vector<RecordingConflictResolver::RecordResolve>& resolutions, bool threads,
                  TimerStat& timer) {
  std::vector<PremergeJob> jobs;
  {
    TimerStat step(timer, "Clone base roots");
    for (PremergeTarget& target : targets) {
      jobs.push_back({target, nullptr});
      if (target.versions == nullptr) jobs.back().copy.reset(documents.base.Clone());
    }
  }
  const PremergeInput input = {documents, diffs, resolutions};
  if (!threads) {
    for (PremergeJob& job : jobs) PremergeThreadFunction(job, input, timer);
    return;
  }
  std::array<Thread, 2> workers;
  for (size_t i = 0; i < jobs.size(); ++i) SpawnPremergeThread(workers[i], jobs[i], input, timer);
  for (Thread& worker : workers) worker.Join();
  for (Thread& worker : workers) worker.CheckForExceptions();
}

}  // namespace vexel_yaml
