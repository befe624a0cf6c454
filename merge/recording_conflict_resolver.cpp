#include "merge/recording_conflict_resolver.h"

#include <algorithm>
#include <iterator>

#include "diff/merge_tree_visitor.h"
#include "merge/merge_additions.h"
#include "yaml/yaml_alloc.h"

namespace vexel_yaml {

namespace {

// A deep copy whose scalar values are all empty.
const Operation* Blanked(const Operation* operation) {
  Operation* blank = MergeTreeCloneVisitor::Clone(operation);
  MergeTreeClearVisitor visitor;
  blank->Accept(visitor);
  return blank;
}

// Null for the path of a whole file.
const YAMLScalar* FirstOf(const FieldPath& path) { return path.empty() ? nullptr : path.front(); }

}  // namespace

bool RecordingConflictResolver::HasPendingConflicts() const {
  return std::any_of(records_.begin(), records_.end(),
                     [](const Record& record) { return record.resolution == MergeResolve::kConflict; });
}

void RecordingConflictResolver::SetResolveMethodForPaths(std::vector<RecordResolve> resolutions) {
  resolutions_ = std::move(resolutions);
  resolved_patterns_.clear();
  resolutions_by_first_.clear();
  for (size_t i = 0; i < resolutions_.size(); ++i) {
    const FieldPath& pattern = resolutions_[i].pattern;
    FieldPath& resolved = resolved_patterns_.emplace_back();
    std::ranges::transform(pattern, std::back_inserter(resolved), ResolveEscapes);
    resolutions_by_first_[FirstOf(pattern)].push_back(i);
    if (FirstOf(resolved) != FirstOf(pattern)) resolutions_by_first_[FirstOf(resolved)].push_back(i);
  }
}

bool RecordingConflictResolver::Matches(size_t place, const FieldPath& path) const {
  const FieldPath& pattern = resolutions_[place].pattern;
  if (pattern.size() != path.size()) return false;
  for (size_t i = 0; i < path.size(); ++i) {
    if (pattern[i] != YAMLScalar::star && pattern[i] != path[i] && resolved_patterns_[place][i] != path[i]) {
      return false;
    }
  }
  return true;
}

size_t RecordingConflictResolver::FindResolution(const YAMLScalar* first, const FieldPath& path) const {
  const auto found = resolutions_by_first_.find(first);
  if (found == resolutions_by_first_.end()) return resolutions_.size();
  const auto match = std::ranges::find_if(found->second, [&](size_t place) { return Matches(place, path); });
  return match == found->second.end() ? resolutions_.size() : *match;
}

std::vector<FieldPath> RecordingConflictResolver::FindUnmatchedPatterns() const {
  std::vector<bool> matched(resolutions_.size(), false);
  if (!resolutions_.empty()) {
    for (const Record& record : records_) {
      for (const YAMLScalar* first : {FirstOf(record.path), YAMLScalar::star}) {
        const auto found = resolutions_by_first_.find(first);
        if (found == resolutions_by_first_.end()) continue;
        for (const size_t place : found->second)
          matched[place] = matched[place] || Matches(place, record.path);
      }
    }
  }
  std::vector<FieldPath> unmatched;
  for (size_t i = 0; i < resolutions_.size(); ++i) {
    if (!matched[i]) unmatched.push_back(resolutions_[i].pattern);
  }
  return unmatched;
}

MergeResolve RecordingConflictResolver::FindResolution(const FieldPath& path) const {
  if (resolutions_.empty()) return MergeResolve::kAutomatic;
  const size_t first = std::min(FindResolution(FirstOf(path), path), FindResolution(YAMLScalar::star, path));
  return first == resolutions_.size() ? MergeResolve::kAutomatic : resolutions_[first].resolution;
}

RecordingConflictResolver::Record& RecordingConflictResolver::AddRecord(FieldPath path, ConflictType type,
                                                                        MergeResolve resolution,
                                                                        const Operation* left,
                                                                        const Operation* right) {
  if (path.size() == 1) object_records_.emplace(path.front(), records_.size());
  records_.push_back({std::move(path), type, resolution, left, right});
  return records_.back();
}

void RecordingConflictResolver::AddRecord(Record record) {
  AddRecord(std::move(record.path), record.type, record.resolution, record.left, record.right);
}

MergeResolve RecordingConflictResolver::SettleConflict(FieldPath path, ConflictType type,
                                                       const Operation* left, const Operation* right) {
  const MergeResolve found = FindResolution(path);
  const bool is_settled =
      found == MergeResolve::kBase || found == MergeResolve::kLeft || found == MergeResolve::kRight;
  AddRecord(std::move(path), type, is_settled ? found : MergeResolve::kConflict, left, right);
  const MergeResolve side = is_settled ? found : default_side_;
  return side == MergeResolve::kLeft || side == MergeResolve::kRight ? side : MergeResolve::kBase;
}

template <typename T>
const Operation* RecordingConflictResolver::SingleSideResolve(const T* operation, ConflictType type) {
  const bool from_left = IsLeftType(type);
  const MergeResolve resolution = FindResolution(GetPath());
  AddRecord(GetPath(), type, resolution, from_left ? operation : nullptr, from_left ? nullptr : operation);
  switch (resolution) {
    case MergeResolve::kBase:
    case MergeResolve::kConflict:
      return nullptr;
    case MergeResolve::kLeft:
      return from_left ? operation : nullptr;
    case MergeResolve::kRight:
      return from_left ? nullptr : operation;
    case MergeResolve::kAutomatic:
    case MergeResolve::kBlank:
    case MergeResolve::kBreakCycle:
      break;
  }
  return operation;
}

const Operation* RecordingConflictResolver::OnValueAdded(const AddOperation* operation, ConflictType type) {
  return SingleSideResolve(operation, type);
}

const Operation* RecordingConflictResolver::OnValueChanged(const ChangeOperation* operation,
                                                           ConflictType type) {
  return SingleSideResolve(operation, type);
}

const Operation* RecordingConflictResolver::OnValueRemoved(const RemoveOperation* operation,
                                                           ConflictType type) {
  const Operation* result = SingleSideResolve(operation, type);
  records_.back().left = nullptr;
  records_.back().right = nullptr;
  return result;
}

const Operation* RecordingConflictResolver::OnMappingChanged(const ChangeMappingOperation* operation,
                                                             ConflictType type) {
  return SingleSideResolve(operation, type);
}

const Operation* RecordingConflictResolver::OnSequenceChanged(const ChangeSequenceOperation* operation,
                                                              ConflictType type) {
  return SingleSideResolve(operation, type);
}

const Operation* RecordingConflictResolver::ProvisionalResult(const Operation* left, const Operation* right,
                                                              const Operation* blank_source) const {
  switch (default_side_) {
    case MergeResolve::kLeft:
      return left;
    case MergeResolve::kRight:
      return right;
    case MergeResolve::kBlank:
      return Blanked(blank_source);
    case MergeResolve::kBase:
    case MergeResolve::kAutomatic:
    case MergeResolve::kConflict:
    case MergeResolve::kBreakCycle:
      break;
  }
  return nullptr;
}

template <typename Settle>
const Operation* RecordingConflictResolver::TwoSidedResolve(ConflictType type, const Operation* left,
                                                            const Operation* right,
                                                            const Operation* blank_source, Settle settle) {
  MergeResolve resolution = FindResolution(GetPath());
  const Operation* result = nullptr;
  if (resolution == MergeResolve::kLeft) {
    result = left;
  } else if (resolution == MergeResolve::kRight) {
    result = right;
  } else if (resolution == MergeResolve::kAutomatic) {
    result = settle();
    if (result == nullptr) resolution = MergeResolve::kConflict;
  }
  if (resolution == MergeResolve::kConflict) result = ProvisionalResult(left, right, blank_source);
  AddRecord(GetPath(), type, resolution, left, right);
  return result;
}

const Operation* RecordingConflictResolver::MergeAdditions(const AddOperation* left,
                                                           const AddOperation* right) {
  if (YAMLSequenceRemapper::IsMergeablePath(GetPath())) {
    if (const AddOperation* merged = MergeAddedValues(*left, *right, *this)) return merged;
  }
  return OperationEquals(*left, *right) ? left : nullptr;
}

const Operation* RecordingConflictResolver::OnSameValueAdded(const AddOperation* left,
                                                             const AddOperation* right) {
  return TwoSidedResolve(ConflictType::kBothAdd, left, right, left,
                         [&] { return MergeAdditions(left, right); });
}

const Operation* RecordingConflictResolver::OnSameValueChanged(const ChangeOperation* left,
                                                               const ChangeOperation* right) {
  return TwoSidedResolve(ConflictType::kBothChange, left, right, left,
                         [&] { return OperationEquals(*left, *right) ? left : nullptr; });
}

const Operation* RecordingConflictResolver::OnSameValueChanged(const RemoveOperation* left,
                                                               const ChangeOperation* right) {
  return TwoSidedResolve(ConflictType::kLeftRemovesRightChanges, left, right, right, [] { return nullptr; });
}

const Operation* RecordingConflictResolver::OnSameValueChanged(const RemoveOperation* left,
                                                               const ChangeMappingOperation* right) {
  return TwoSidedResolve(ConflictType::kLeftRemovesRightChanges, left, right, right, [] { return nullptr; });
}

const Operation* RecordingConflictResolver::OnSameValueRemoved(const RemoveOperation* left,
                                                               const RemoveOperation* right) {
  return TwoSidedResolve(ConflictType::kBothRemove, left, right, left, [&] { return left; });
}

const Operation* RecordingConflictResolver::OnSameMappingChanged(const ChangeMappingOperation* left,
                                                                 const ChangeMappingOperation* right) {
  return TwoSidedResolve(ConflictType::kBothChange, left, right, left, [&]() -> const Operation* {
    if (left->IsMergeable() && right->IsMergeable() && YAMLSequenceRemapper::IsMergeablePath(GetPath())) {
      return ChangeMappingOperation::Merge(*left, *right, *this);
    }
    return OperationEquals(*left, *right) ? left : nullptr;
  });
}

const Operation* RecordingConflictResolver::OnSameSequenceChanged(const ChangeSequenceOperation* left,
                                                                  const ChangeSequenceOperation* right) {
  return TwoSidedResolve(ConflictType::kBothChange, left, right, left, [&]() -> const Operation* {
    if (left->IsMergeable() && right->IsMergeable() && YAMLSequenceRemapper::IsMergeablePath(GetPath())) {
      return ChangeSequenceOperation::Merge(*left, *right, *this, true);
    }
    return OperationEquals(*left, *right) ? left : nullptr;
  });
}

void RecordingConflictResolver::OnTransformCycleDetected(const YAMLScalar* object,
                                                         const YAMLMapping* transform,
                                                         const YAMLScalar* /*cycle*/) {
  const YAMLScalar* body =
      transform->HasKey(YAMLScalar::transform) ? YAMLScalar::transform : YAMLScalar::rectTransform;
  const FieldPath path = {object, body, YAMLScalar::mFather};
  MergeResolve resolution = FindResolution(path);
  if (resolution == MergeResolve::kAutomatic) resolution = MergeResolve::kConflict;
  AddRecord(path, ConflictType::kTransformCycle, resolution, nullptr, nullptr);
}

bool RecordingConflictResolver::OnComponentDependencyConflict(const ComponentDependencyConflict& conflict) {
  const YAMLScalar* object = conflict.first != YAMLScalar::null ? conflict.first : conflict.second;
  const auto found = object_records_.find(object);
  Record& record = found != object_records_.end()
                       ? records_[found->second]
                       : AddRecord({object}, conflict.type, FindResolution({object}), nullptr, nullptr);
  const bool settled =
      record.resolution != MergeResolve::kAutomatic && record.resolution != MergeResolve::kConflict;
  if (!settled) record.resolution = MergeResolve::kConflict;
  if (conflict.type == ConflictType::kRightRemoves) {
    record.right = YAMLAlloc<RemoveOperation>::create(true);
  } else if (conflict.type == ConflictType::kLeftRemoves) {
    record.left = YAMLAlloc<RemoveOperation>::create(true);
  }
  return !settled;
}

bool RecordingConflictResolverRecordComparer(const RecordingConflictResolver::Record& a,
                                             const RecordingConflictResolver::Record& b) {
  return std::lexicographical_compare(a.path.begin(), a.path.end(), b.path.begin(), b.path.end(),
                                      ScalarTextLess());
}

}  // namespace vexel_yaml
