#include "fixups/component_dependencies.h"

#include <algorithm>
#include <array>
#include <set>
#include <tuple>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "fixups/game_object_components.h"

namespace vexel_yaml {

namespace {

// Type information comes from a file and may hold a loop of bases.
constexpr int kMostBases = 64;

// The type's own ID and those of its bases.
using Lineage = std::vector<const YAMLScalar*>;

// Finds lineages out once for each type.
class Lineages {
 public:
  // Of a component whose type is known; stays valid.
  const Lineage& Of(const Component& component) {
    Lineage& lineage = lineages_[component.type];
    if (lineage.empty()) lineage = LineageOf(*component.type);
    return lineage;
  }

 private:
  std::unordered_map<const YAMLTypeInfo*, Lineage> lineages_;
};

// The components of one game object in one file, ready to be asked.
class ComponentIndex {
 public:
  ComponentIndex(const ComponentList& components, Lineages& lineages) {
    for (const Component& component : components) {
      file_ids_.insert(component.file_id);
      if (component.type == nullptr) continue;
      for (const YAMLScalar* id : lineages.Of(component)) first_of_type_.emplace(id, &component);
    }
  }

  bool Holds(const YAMLScalar* file_id) const { return file_ids_.contains(file_id); }

  // The first component that is of the type or derives from it, null where there is none.
  const Component* FindOfType(const YAMLScalar* type) const {
    const auto found = first_of_type_.find(type);
    return found == first_of_type_.end() ? nullptr : found->second;
  }

 private:
  std::unordered_set<const YAMLScalar*> file_ids_;
  std::unordered_map<const YAMLScalar*, const Component*> first_of_type_;
};

// Where the earliest of some components stands in the merged list, for each combination of sides that had it.
// Two components that one side had together are no conflict.
class Earliest {
 public:
  static constexpr size_t kNone = static_cast<size_t>(-1);

  void Add(unsigned sides, size_t index) { index_[sides] = std::min(index_[sides], index); }

  // The earliest one that shares no side with `sides`.
  size_t FindApartFrom(unsigned sides) const {
    size_t found = kNone;
    for (unsigned other = 0; other < index_.size(); ++other) {
      if ((other & sides) == 0) found = std::min(found, index_[other]);
    }
    return found;
  }

 private:
  std::array<size_t, 4> index_ = {kNone, kNone, kNone, kNone};
};

// Finds for each component of a list the first one before it that it can't stand beside. One look at each
// component: a game object may have been given any number of them, and their pairs are too many.
class ExclusionCheck {
 public:
  explicit ExclusionCheck(Lineages& lineages) : lineages_(lineages) {}

  // To be called with one component after the other. Returns Earliest::kNone where there is none.
  size_t FindPartner(const Component& component, unsigned sides, size_t index) {
    size_t partner = Earliest::kNone;
    const auto look_up = [&](const Table& table, const YAMLScalar* id) {
      const auto found = table.find(id);
      if (found != table.end()) partner = std::min(partner, found->second.FindApartFrom(sides));
    };
    if (!component.type->is_multi_instance) look_up(of_exact_type_, component.type->persistent_type_id);
    const Lineage& lineage = lineages_.Of(component);
    for (const YAMLScalar* id : lineage) {
      look_up(excluding_, id);
      for (const YAMLScalar* excluded : ExcludedBy(id)) look_up(of_type_, excluded);
    }

    of_exact_type_[component.type->persistent_type_id].Add(sides, index);
    for (const YAMLScalar* id : lineage) {
      of_type_[id].Add(sides, index);
      for (const YAMLScalar* excluded : ExcludedBy(id)) excluding_[excluded].Add(sides, index);
    }
    return partner;
  }

 private:
  using Table = std::unordered_map<const YAMLScalar*, Earliest>;

  static const YAMLTypeInfo::TypeSet& ExcludedBy(const YAMLScalar* id) {
    static const YAMLTypeInfo::TypeSet none;
    const YAMLTypeInfo* type = GetTypeInfoManager().GetTypeInfo(id);
    return type == nullptr ? none : type->conflicts_types;
  }

  Lineages& lineages_;
  Table of_exact_type_;
  // By a type: the components that are of it or derive from it, and those that exclude it.
  Table of_type_;
  Table excluding_;
};

// Compares the component lists of one game object in the merged, left and right file.
class DependencyCheck {
 public:
  DependencyCheck(const ComponentList& merged, const ComponentList& left, const ComponentList& right,
                  Lineages& lineages, std::vector<ComponentDependencyConflict>& conflicts)
      : list_(merged),
        merged_(merged, lineages),
        left_(left, lineages),
        right_(right, lineages),
        lineages_(lineages),
        conflicts_(conflicts) {}

  void Run() {
    const std::vector<std::pair<size_t, size_t>> pairs = FindPairs();
    auto pair = pairs.begin();
    for (size_t i = 0; i < list_.size(); ++i) {
      if (list_[i].type == nullptr) continue;
      for (const YAMLScalar* type : list_[i].type->requires_types) CheckRequired(type);
      for (; pair != pairs.end() && pair->first == i; ++pair) AddExcluded(list_[pair->second].file_id);
    }
  }

 private:
  // The indices of two components that only the merge brought together, in the order of the first ones. The
  // later one is the one concerned, so it is reported once, with the first one before it.
  std::vector<std::pair<size_t, size_t>> FindPairs() {
    std::vector<std::pair<size_t, size_t>> pairs;
    ExclusionCheck check(lineages_);
    for (size_t i = 0; i < list_.size(); ++i) {
      if (list_[i].type == nullptr) continue;
      const unsigned sides =
          (left_.Holds(list_[i].file_id) ? 1U : 0U) | (right_.Holds(list_[i].file_id) ? 2U : 0U);
      const size_t partner = check.FindPartner(list_[i], sides, i);
      if (partner != Earliest::kNone) pairs.emplace_back(partner, i);
    }
    std::ranges::sort(pairs);
    return pairs;
  }

  // A required component that one side had and the other removed.
  void CheckRequired(const YAMLScalar* type) {
    if (merged_.FindOfType(type) != nullptr) return;
    const Component* in_left = left_.FindOfType(type);
    const Component* in_right = right_.FindOfType(type);
    if (in_left != nullptr && in_right == nullptr) {
      conflicts_.push_back({YAMLScalar::null, in_left->file_id, 1, ConflictType::kRightRemoves});
    } else if (in_left == nullptr && in_right != nullptr) {
      conflicts_.push_back({in_right->file_id, YAMLScalar::null, 1, ConflictType::kLeftRemoves});
    }
  }

  void AddExcluded(const YAMLScalar* file_id) {
    if (right_.Holds(file_id)) {
      conflicts_.push_back({YAMLScalar::null, file_id, 1, ConflictType::kRightAdds});
    } else {
      conflicts_.push_back({file_id, YAMLScalar::null, 1, ConflictType::kLeftAdds});
    }
  }

  const ComponentList& list_;
  const ComponentIndex merged_;
  const ComponentIndex left_;
  const ComponentIndex right_;
  Lineages& lineages_;
  std::vector<ComponentDependencyConflict>& conflicts_;
};

// A list that both sides have as it is can't have been broken by the merge.
bool IsEverywhereTheSame(const ComponentList& merged, const ComponentList& left, const ComponentList& right) {
  const auto is_same = [](const Component& a, const Component& b) {
    return a.file_id == b.file_id && a.type == b.type;
  };
  return std::ranges::equal(merged, left, is_same) && std::ranges::equal(merged, right, is_same);
}

// A game object that one side removed while a component of it survived.
void CheckDangling(const YAMLScalar* game_object, const YAMLMapping& left, const YAMLMapping& right,
                   std::vector<ComponentDependencyConflict>& conflicts) {
  if (left.HasKey(game_object)) {
    conflicts.push_back({YAMLScalar::null, game_object, 1, ConflictType::kRightRemoves});
  } else if (right.HasKey(game_object)) {
    conflicts.push_back({game_object, YAMLScalar::null, 1, ConflictType::kLeftRemoves});
  }
}

std::vector<ComponentDependencyConflict> WithoutRepeats(
    const std::vector<ComponentDependencyConflict>& conflicts) {
  std::set<std::tuple<const YAMLScalar*, const YAMLScalar*, ConflictType>> seen;
  std::vector<ComponentDependencyConflict> unique;
  for (const ComponentDependencyConflict& conflict : conflicts) {
    if (seen.emplace(conflict.first, conflict.second, conflict.type).second) unique.push_back(conflict);
  }
  return unique;
}

}  // namespace

std::vector<const YAMLScalar*> LineageOf(const YAMLTypeInfo& info) {
  std::vector<const YAMLScalar*> lineage = {info.persistent_type_id};
  const YAMLTypeInfo* type = &info;
  for (int step = 0; step < kMostBases && type != nullptr; ++step) {
    if (std::ranges::count(lineage, type->base_persistent_type_id) != 0) break;
    lineage.push_back(type->base_persistent_type_id);
    type = GetTypeInfoManager().GetTypeInfo(type->base_persistent_type_id);
  }
  return lineage;
}

std::vector<ComponentDependencyConflict> FindComponentDependencyConflicts(const YAMLMapping& merged,
                                                                          const YAMLMapping& left,
                                                                          const YAMLMapping& right) {
  const GameObjectComponents in_merged = CollectGameObjectComponents(merged);
  std::vector<ComponentDependencyConflict> conflicts;
  for (const YAMLScalar* game_object : in_merged.dangling) CheckDangling(game_object, left, right, conflicts);

  const GameObjectComponents in_left = CollectGameObjectComponents(left);
  const GameObjectComponents in_right = CollectGameObjectComponents(right);
  Lineages lineages;
  for (const YAMLScalar* game_object : in_merged.game_objects) {
    const ComponentList& components = in_merged.GetComponents(game_object);
    const ComponentList& left_components = in_left.GetComponents(game_object);
    const ComponentList& right_components = in_right.GetComponents(game_object);
    if (IsEverywhereTheSame(components, left_components, right_components)) continue;
    DependencyCheck(components, left_components, right_components, lineages, conflicts).Run();
  }
  return WithoutRepeats(conflicts);
}

}  // namespace vexel_yaml
