#include "fixups/transform_cycles.h"

#include <unordered_set>
#include <vector>

#include "fixups/engine_keys.h"
#include "platform/hinted_error.h"

namespace vexel_yaml {

namespace {

// A transform with as many parents above it, or more, is taken to be in a loop.
constexpr int kDeepestHierarchy = 100;

bool IsInCycle(const TransformParents& parents, const YAMLScalar* transform) {
  const YAMLScalar* current = transform;
  for (int steps = 0; steps < kDeepestHierarchy; ++steps) {
    const YAMLScalar* const parent = parents.GetParent(current);
    if (parent == nullptr) {
      throw HintedError("Cannot find transform parent for fileID", "on the way up from object " +
                                                                       transform->GetText() + ", object " +
                                                                       current->GetText() + " is missing");
    }
    current = parent;
    if (IsNullReference(current)) return false;
    if (current == transform) return true;
  }
  return true;
}

void Break(const FileIDMap& objects, TransformParents& parents, ConflictResolver& resolver,
           const YAMLScalar* transform) {
  const YAMLMapping* object = objects.Find(transform);
  if (object == nullptr) {
    throw HintedError("Cannot find transform mapping from fileID while breaking cycle.",
                      "object " + transform->GetText() + " is missing");
  }
  resolver.OnTransformCycleDetected(transform, object, transform);
  parents.Detach(transform);
}

// Finds the loops that nobody has collected: each side moved one transform, say. Every transform is walked
// over once, however deep the hierarchy.
class CycleSearch {
 public:
  explicit CycleSearch(const TransformParents& parents) : parents_(parents) {}

  // Whether a walk up from `transform` returns to it.
  bool IsInCycle(const YAMLScalar* transform) {
    if (in_cycle_.contains(transform)) return true;
    std::vector<const YAMLScalar*> walk;
    std::unordered_set<const YAMLScalar*> on_walk;
    const YAMLScalar* current = transform;
    while (!IsNullReference(current) && !safe_.contains(current) && !in_cycle_.contains(current) &&
           on_walk.insert(current).second) {
      walk.push_back(current);
      current = parents_.GetParent(current);
    }
    // Where the walk met itself, it has a loop from that place on; what leads there is on none.
    bool in_loop = false;
    for (const YAMLScalar* step : walk) {
      in_loop = in_loop || step == current;
      (in_loop ? in_cycle_ : safe_).insert(step);
    }
    return in_cycle_.contains(transform);
  }

  // To be called before the loop through `transform` is broken there.
  void MarkBroken(const YAMLScalar* transform) {
    for (const YAMLScalar* step = transform; in_cycle_.erase(step) != 0; step = parents_.GetParent(step)) {
      safe_.insert(step);
    }
  }

 private:
  const TransformParents& parents_;
  std::unordered_set<const YAMLScalar*> safe_;
  std::unordered_set<const YAMLScalar*> in_cycle_;
};

}  // namespace

void BreakTransformCycles(YAMLMapping& merged, TransformParents& parents, ConflictResolver& resolver) {
  const FileIDMap objects = CollectFileIDMap(merged);
  for (const YAMLScalar* transform : resolver.GetMergedTransforms()) {
    if (!objects.Contains(transform)) {
      throw HintedError("Cannot find transform mapping from fileID while looking for cycles.",
                        "object " + transform->GetText() + " is missing");
    }
    if (IsInCycle(parents, transform)) Break(objects, parents, resolver, transform);
  }
  CycleSearch search(parents);
  for (const auto& [file_id, object] : merged) {
    if (parents.GetParent(file_id) == nullptr || !search.IsInCycle(file_id)) continue;
    search.MarkBroken(file_id);
    Break(objects, parents, resolver, file_id);
  }
}

}  // namespace vexel_yaml
