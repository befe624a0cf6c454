#include "scene/safe_merge.h"

#include "fixups/post_process.h"
#include "fixups/state_machine_transitions.h"

namespace vexel_yaml {

SafeMergeResult SafeMerge(SceneDocuments& documents, RecordingConflictResolver& resolver,
                          const SafeMergeOptions& options, TimerStat& timer) {
  const auto& [base, left, right] = static_cast<const MergeDocuments&>(documents);
  DiffPair diffs;
  {
    TimerStat step(timer, "Creating diffs");
    diffs = CreateDiffPair({base, left}, {base, right}, options.threads, step);
  }
  SafeMergeResult result;
  result.merged = MergeIntoCopy(base, diffs, resolver, timer);
  TimerStat step(timer, "Post process merged changes");
  if (options.keep_comparable) result.unrepaired.reset(result.merged->Clone());
  RepairMerged(*result.merged, left, right, resolver);
  result.breaks_dependency = ReportBrokenDependencies(*result.merged, left, right, resolver);
  if (options.keep_comparable) result.repaired.reset(result.merged->Clone());
  TransitionsToMappings(*result.merged);
  return result;
}

}  // namespace vexel_yaml
