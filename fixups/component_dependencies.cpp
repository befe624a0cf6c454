#include "fixups/component_dependencies.h"

#include <algorithm>
#include <map>
#include <set>
#include <tuple>
#include <unordered_map>
#include <utility>

#include "fixups/game_object_components.h"

namespace vexel_yaml {

namespace {

// Type information comes from a file and may hold a loop of bases.
constexpr int kMostBases = 64;

// What the types of a scene have to do with one another, found out once for each type or pair of types.
class TypeRelations {
 public:
  bool IsOrDerivesFrom(const Component& component, const YAMLScalar* type) {
    return component.type != nullptr && std::ranges::count(LineageOf(*component.type), type) != 0;
  }

  const Component* FindOfType(const ComponentList& components, const YAMLScalar* type) {
    const auto found = std::ranges::find_if(
        components, [&](const Component& component) { return IsOrDerivesFrom(component, type); });
    return found == components.end() ? nullptr : &*found;
  }

  bool CanStandTogether(const YAMLTypeInfo& a, const YAMLTypeInfo& b) {
    const auto [known, is_new] = can_stand_together_.try_emplace({&a, &b}, true);
    if (!is_new) return known->second;
    const bool doubled = a.persistent_type_id == b.persistent_type_id && !a.is_multi_instance;
    return known->second = !doubled && !Excludes(a, b) && !Excludes(b, a);
  }

 private:
  // The type's own ID and those of its bases.
  const std::vector<const YAMLScalar*>& LineageOf(const YAMLTypeInfo& type) {
    std::vector<const YAMLScalar*>& lineage = lineages_[&type];
    if (!lineage.empty()) return lineage;
    lineage.push_back(type.persistent_type_id);
    const YAMLTypeInfo* current = &type;
    for (int step = 0; step < kMostBases && current != nullptr; ++step) {
      lineage.push_back(current->base_persistent_type_id);
      current = GetTypeInfoManager().GetTypeInfo(current->base_persistent_type_id);
    }
    return lineage;
  }

  // Whether a type of `a`'s lineage names one of `b`'s as one it can't stand beside.
  bool Excludes(const YAMLTypeInfo& a, const YAMLTypeInfo& b) {
    const std::vector<const YAMLScalar*> others = LineageOf(b);
    return std::ranges::any_of(LineageOf(a), [&](const YAMLScalar* id) {
      const YAMLTypeInfo* type = GetTypeInfoManager().GetTypeInfo(id);
      return type != nullptr && std::ranges::any_of(others, [&](const YAMLScalar* other) {
               return type->conflicts_types.contains(other);
             });
    });
  }

  std::unordered_map<const YAMLTypeInfo*, std::vector<const YAMLScalar*>> lineages_;
  std::map<std::pair<const YAMLTypeInfo*, const YAMLTypeInfo*>, bool> can_stand_together_;
};

bool Holds(const ComponentList& components, const YAMLScalar* file_id) {
  return std::any_of(components.begin(), components.end(),
                     [&](const Component& component) { return component.file_id == file_id; });
}

// Compares the component lists of one game object in the merged, left and right file.
class DependencyCheck {
 public:
  DependencyCheck(const ComponentList& merged, const ComponentList& left, const ComponentList& right,
                  TypeRelations& types, std::vector<ComponentDependencyConflict>& conflicts)
      : merged_(merged), left_(left), right_(right), types_(types), conflicts_(conflicts) {}

  void Run() {
    for (size_t i = 0; i < merged_.size(); ++i) {
      if (merged_[i].type == nullptr) continue;
      for (const YAMLScalar* type : merged_[i].type->requires_types) CheckRequired(type);
      for (size_t j = i + 1; j < merged_.size(); ++j) {
        if (merged_[j].type != nullptr) CheckPair(merged_[i], merged_[j]);
      }
    }
  }

 private:
  // A required component that one side had and the other removed.
  void CheckRequired(const YAMLScalar* type) {
    if (types_.FindOfType(merged_, type) != nullptr) return;
    const Component* in_left = types_.FindOfType(left_, type);
    const Component* in_right = types_.FindOfType(right_, type);
    if (in_left != nullptr && in_right == nullptr) {
      conflicts_.push_back({YAMLScalar::null, in_left->file_id, 1, ConflictType::kRightRemoves});
    } else if (in_left == nullptr && in_right != nullptr) {
      conflicts_.push_back({in_right->file_id, YAMLScalar::null, 1, ConflictType::kLeftRemoves});
    }
  }

  // Two components that only the merge brought together.
  void CheckPair(const Component& a, const Component& b) {
    if (types_.CanStandTogether(*a.type, *b.type)) return;
    if (Holds(left_, a.file_id) && Holds(left_, b.file_id)) return;
    if (Holds(right_, a.file_id) && Holds(right_, b.file_id)) return;
    if (Holds(right_, b.file_id)) {
      conflicts_.push_back({YAMLScalar::null, b.file_id, 1, ConflictType::kRightAdds});
    } else {
      conflicts_.push_back({b.file_id, YAMLScalar::null, 1, ConflictType::kLeftAdds});
    }
  }

  const ComponentList& merged_;
  const ComponentList& left_;
  const ComponentList& right_;
  TypeRelations& types_;
  std::vector<ComponentDependencyConflict>& conflicts_;
};

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

std::vector<ComponentDependencyConflict> FindComponentDependencyConflicts(const YAMLMapping& merged,
                                                                          const YAMLMapping& left,
                                                                          const YAMLMapping& right) {
  const GameObjectComponents in_merged = CollectGameObjectComponents(merged);
  std::vector<ComponentDependencyConflict> conflicts;
  for (const YAMLScalar* game_object : in_merged.dangling) CheckDangling(game_object, left, right, conflicts);

  const GameObjectComponents in_left = CollectGameObjectComponents(left);
  const GameObjectComponents in_right = CollectGameObjectComponents(right);
  TypeRelations types;
  for (const YAMLScalar* game_object : in_merged.game_objects) {
    DependencyCheck(in_merged.GetComponents(game_object), in_left.GetComponents(game_object),
                    in_right.GetComponents(game_object), types, conflicts)
        .Run();
  }
  return WithoutRepeats(conflicts);
}

}  // namespace vexel_yaml
