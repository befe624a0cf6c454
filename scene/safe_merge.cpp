#include "scene/safe_merge.h"

#include "fixups/post_process.h"
#include "fixups/state_machine_transitions.h"

namespace vexel_yaml {

SafeMergeResult SafeMerge(SceneDocuments& documents, RecordingConflictResolver& resolver,
                          const SafeMergeOptions& options, TimerStat& timer) {
  auto& [base, left, right] = static_cast<MergeDocuments&>(documents);
  SettledScene settled;
  {
    TimerStat step(timer, "Settling the scene");
    settled = SettleScene({base, left, right}, resolver, options.threads);
  }
  DiffPair diffs;
  {
    TimerStat step(timer, "Creating diffs");
    diffs = CreateDiffPair({base, left}, {base, right}, options.threads, step);
  }
  SafeMergeResult result;
  result.merged = MergeIntoCopy(base, diffs, resolver, timer);
  TimerStat step(timer, "Post process merged changes");
  if (options.keep_comparable) result.unrepaired.reset(result.merged->Clone());
  CheckMergedScene(settled, base, *result.merged, resolver, options.threads);
  result.notes = std::move(settled.notes);
  result.breaks_dependency = ReportBrokenDependencies(*result.merged, left, right, resolver);
  if (options.keep_comparable) result.repaired.reset(result.merged->Clone());
  // In this order: making mappings of the transitions copies what they hold.
  TransitionsToMappings(*result.merged);
  documents.repeated_keys.Restore(*result.merged);
  return result;
}

}  // namespace vexel_yaml
