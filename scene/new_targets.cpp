#include "scene/new_targets.h"

#include <string>
#include <unordered_map>

#include "rules/path_step.h"
#include "scene/list_alignment.h"
#include "scene/object_links.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

namespace {

class TargetComparison {
 public:
  explicit TargetComparison(const YAMLScalar* file_id) : path_({file_id}) {}

  // `base` may be null.
  void Compare(const YAMLNode* base, const YAMLNode* side) {
    if (const YAMLMapping* mapping = side == nullptr ? nullptr : side->AsMapping()) {
      CompareMappings(base == nullptr ? nullptr : base->AsMapping(), *mapping);
    } else if (const YAMLSequence* list = side == nullptr ? nullptr : side->AsSequence()) {
      CompareLists(base == nullptr ? nullptr : base->AsSequence(), *list);
    }
  }

  const std::unordered_set<const YAMLScalar*>& Get() const { return targets_; }

 private:
  void CompareMappings(const YAMLMapping* base, const YAMLMapping& side) {
    if (const YAMLScalar* target = GetLocalTarget(&side)) {
      if (GetLocalTarget(base) != target) targets_.insert(target);
    }
    if (side.HasDuplicateKeys() || (base != nullptr && base->HasDuplicateKeys())) return;
    for (const auto& [key, value] : side) {
      const PathStep step(path_, key);
      Compare(base == nullptr ? nullptr : base->Get(key), value);
    }
  }

  void CompareLists(const YAMLSequence* base, const YAMLSequence& side) {
    const auto alignment = base == nullptr ? std::nullopt : AlignLists(path_, *base, side, side);
    if (!alignment) return CountIn(base, side);
    for (const AlignedElement& element : alignment->elements) {
      if (element.left == kNoIndex) continue;
      const PathStep step(path_, YAMLScalar::Lookup(IntToString(static_cast<int>(element.left))));
      Compare(element.base == kNoIndex ? nullptr : base->GetItems()[element.base],
              side.GetItems()[element.left]);
    }
  }

  // Where elements can't be told apart, to refer to something more often is to refer to it anew.
  void CountIn(const YAMLSequence* base, const YAMLSequence& side) {
    std::unordered_map<const YAMLScalar*, int> count;
    VisitReferences(const_cast<YAMLSequence*>(&side),
                    [&](YAMLMapping& reference) { ++count[GetLocalTarget(&reference)]; });
    VisitReferences(const_cast<YAMLSequence*>(base),
                    [&](YAMLMapping& reference) { --count[GetLocalTarget(&reference)]; });
    for (const auto& [target, more] : count) {
      if (more > 0) targets_.insert(target);
    }
  }

  FieldPath path_;
  std::unordered_set<const YAMLScalar*> targets_;
};

}  // namespace

std::unordered_set<const YAMLScalar*> FindNewTargets(const YAMLScalar* file_id, const YAMLNode* base,
                                                     const YAMLNode* object) {
  TargetComparison comparison(file_id);
  comparison.Compare(base, object);
  return comparison.Get();
}

}  // namespace vexel_yaml
