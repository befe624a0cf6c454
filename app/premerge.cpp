#include "app/premerge.h"

#include <memory>

#include "fixups/post_process.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/thread.h"

namespace vexel_yaml {

namespace {

// One premerged file on its way.
struct PremergeJob {
  const PremergeTarget& target;
  // A fresh copy of base: one that already holds the merge can't take it again.
  std::unique_ptr<VexelObjects> copy;
};

void Premerge(PremergeJob& job, const MergeDocuments& documents, const DiffPair& diffs,
              const std::vector<RecordingConflictResolver::RecordResolve>& resolutions, TimerStat& timer) {
  RecordingConflictResolver resolver(job.target.side);
  // What the user has settled is no conflict in any of the files.
  resolver.SetResolveMethodForPaths(resolutions);
  const YAMLMappingDiff* diff = nullptr;
  {
    TimerStat step(timer, "Merging premerge");
    diff = YAMLMappingDiff::Merge(*diffs.left, *diffs.right, resolver);
  }
  {
    TimerStat step(timer, "Applying premerge merged changes");
    diff->Apply(*job.copy);
    PostProcessMergeOnly(*job.copy, documents.left, documents.right, resolver);
  }
  TimerStat step(timer, "Output premerge result");
  FileReplacement file(VexelToNativePath(job.target.path));
  job.copy->Output(file.Stream());
  file.Commit();
}

}  // namespace

void RunPremerges(const std::array<PremergeTarget, 2>& targets, const MergeDocuments& documents,
                  const DiffPair& diffs,
                  const std::vector<RecordingConflictResolver::RecordResolve>& resolutions, bool threads,
                  TimerStat& timer) {
  std::vector<PremergeJob> jobs;
  {
    TimerStat step(timer, "Clone base roots");
    for (const PremergeTarget& target : targets) {
      jobs.push_back({target, std::unique_ptr<VexelObjects>(documents.base.Clone())});
    }
  }
  if (!threads) {
    for (PremergeJob& job : jobs) Premerge(job, documents, diffs, resolutions, timer);
    return;
  }
  std::array<Thread, 2> workers;
  for (size_t i = 0; i < jobs.size(); ++i) {
    workers[i].Start([&, i] { Premerge(jobs[i], documents, diffs, resolutions, timer); });
  }
  for (Thread& worker : workers) worker.Join();
  for (Thread& worker : workers) worker.CheckForExceptions();
}

}  // namespace vexel_yaml
