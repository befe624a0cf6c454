#pragma once

#include <optional>
#include <set>
#include <string>
#include <vector>

#include "merge/recording_conflict_resolver.h"
#include "scene/scene_edits.h"

namespace vexel_yaml {

/// An edit of one side against one of the other that only a person can settle, as a whole.
struct Contest {
  /// The thing's file ID, or the place of a father.
  FieldPath path;
  ConflictType type = ConflictType::kBothChange;
  /// What each side did, for people. Copies.
  const Operation* left = nullptr;
  const Operation* right = nullptr;

  /// What the user wants, kConflict while it is open.
  MergeResolve resolution = MergeResolve::kConflict;
  /// What is to stand: base, left or right.
  MergeResolve side = MergeResolve::kBase;
  /// Why a choice of the user's could not be carried out.
  std::string reason;
  /// The sides that were found not to stand beside other choices.
  std::set<MergeResolve> excluded;

  /// One side deleted the thing, and the other did something to it.
  struct Deleted {
    SceneSide by;
    /// The place in that side's deletions; kNone for a component that lost what it requires.
    size_t deletion;
    /// The objects that the contest is about: a part that the other side moved out, or what is left of the
    /// deletion without these parts.
    std::vector<const YAMLScalar*> objects;
    /// What the other side added to the thing, with all below it.
    std::vector<const YAMLScalar*> additions;
    /// The transforms and prefab instances that the other side moved below it.
    std::vector<const YAMLScalar*> moved_in;
    /// The components that the other side added elsewhere in the same game object, and that require this one.
    std::vector<const YAMLScalar*> requiring;
  };
  std::optional<Deleted> deleted;

  /// Else the object of which it is contested where it hangs, or, of one that both sides added, what it is a
  /// part of.
  const YAMLScalar* node = nullptr;
  bool is_about_owner = false;

  bool IsSettled() const { return resolution != MergeResolve::kConflict; }
};

/// Finds them, circles aside, in no particular order.
std::vector<Contest> FindContests(const SceneEdits& edits);

/// A contest about the father of a transform or prefab instance that both sides have.
Contest MakeFatherContest(const SceneEdits& edits, const YAMLScalar* node);

/// A contest about what an object that both sides added is a part of.
Contest MakeOwnerContest(const SceneEdits& edits, const YAMLScalar* component);

/// A contest about a component that one side added, and that requires what the other side deleted.
Contest MakeRequirementContest(const SceneEdits& edits, SceneSide deleter, const YAMLScalar* component);

/// Where the father of an object stands: the path of the reference.
FieldPath FatherPath(const YAMLScalar* node, const YAMLNode* object);

/// What one side did to an object, null for nothing. A copy.
const Operation* EditInShort(const SceneEdits& edits, SceneSide side, const YAMLScalar* file_id);

/// The same for some objects, as one operation on the file.
const Operation* EditsInShort(const SceneEdits& edits, SceneSide side,
                              const std::vector<const YAMLScalar*>& objects);

}  // namespace vexel_yaml
