#include "app/safe_laws.h"

#include <algorithm>
#include <set>

#include "app/lost_edits.h"
#include "scene/safe_merge.h"
#include "scene/scene_check.h"

namespace vexel_yaml {

namespace {

// A safe merge of copies.
struct SafelyMerged {
  SafelyMerged(const VexelObjects& base, const VexelObjects& left, const VexelObjects& right) {
    base.CopyTo(documents.base);
    left.CopyTo(documents.left);
    right.CopyTo(documents.right);
    TimerStat silent("", nullptr);
    scene = SafeMerge(documents, resolver, {.threads = false, .keep_comparable = true}, silent).repaired;
  }

  bool IsPendingAt(const YAMLScalar* file_id) const {
    return std::ranges::any_of(resolver.GetRecords(), [&](const RecordingConflictResolver::Record& record) {
      return record.resolution == MergeResolve::kConflict && record.path == FieldPath{file_id};
    });
  }

  // The merged scene and the records refer to it.
  SceneDocuments documents;
  RecordingConflictResolver resolver{MergeResolve::kBase};
  std::unique_ptr<VexelObjects> scene;
};

}  // namespace

bool TakesEqualEditsOnce(const VexelObjects& base, const VexelObjects& side) {
  const SafelyMerged merged(base, side, side);
  return !merged.resolver.HasPendingConflicts() && Content(merged.scene.get()) == Content(&side);
}

bool KeepsSceneSound(const SceneTriple& triple) {
  const SafelyMerged merged(*triple.base, *triple.left, *triple.right);
  std::set<const YAMLScalar*> broken;
  for (const VexelObjects* version : {triple.base.get(), triple.left.get(), triple.right.get()}) {
    for (const SceneFault& fault : CheckScene(*version)) broken.insert(fault.file_id);
  }
  return std::ranges::all_of(CheckScene(*merged.scene), [&](const SceneFault& fault) {
    return broken.contains(fault.file_id) || merged.IsPendingAt(fault.file_id);
  });
}

}  // namespace vexel_yaml
