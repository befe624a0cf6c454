#include <algorithm>
#include <iterator>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "scene/object_links.h"
#include "scene/scene_plan.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;
using Source = ScenePlan::Source;

// Whether a contest is about an object itself.
bool Decides(const Contest& contest, const YAMLScalar* node) {
  if (!contest.deleted) return contest.node == node && !contest.is_about_owner;
  return std::ranges::find(contest.deleted->objects, node) != contest.deleted->objects.end();
}

// Whether a contest decides where an object hangs.
bool Places(const Contest& contest, const YAMLScalar* node) {
  return Decides(contest, node) || (contest.deleted && std::ranges::find(contest.deleted->moved_in, node) !=
                                                           contest.deleted->moved_in.end());
}

// Whether a contest decides that an object is there.
bool Removes(const Contest& contest, const YAMLScalar* file_id) {
  if (!contest.deleted) return false;
  const FileIDs& additions = contest.deleted->additions;
  return Decides(contest, file_id) || std::ranges::find(additions, file_id) != additions.end();
}

class Reconciliation {
 public:
  Reconciliation(const SceneEdits& edits, const RecordingConflictResolver& resolver,
                 std::vector<Contest>& contests, ScenePlan& plan)
      : edits_(edits), resolver_(resolver), contests_(contests), plan_(plan) {
    CollectNodes();
    SortContests();
  }

  // One side moved one of them, the other another: each contest shows both moves.
  void AddCircle(const FileIDs& moved) {
    std::vector<Contest> added;
    MergeResolve chosen = MergeResolve::kConflict;
    for (const YAMLScalar* node : moved) {
      Contest contest = MakeFatherContest(edits_, node);
      FileIDs others = moved;
      std::erase(others, node);
      if (contest.left == nullptr) contest.left = EditsInShort(edits_, SceneSide::kLeft, others);
      if (contest.right == nullptr) contest.right = EditsInShort(edits_, SceneSide::kRight, others);
      Decide(resolver_, contest);
      if (contest.IsSettled() && chosen == MergeResolve::kConflict) chosen = contest.resolution;
      added.push_back(std::move(contest));
    }
    // They are one: who has settled one of them has settled the others.
    for (Contest& contest : added) {
      if (chosen != MergeResolve::kConflict && !contest.IsSettled())
        contest.resolution = contest.side = chosen;
      contests_.push_back(std::move(contest));
    }
    circles_.push_back(moved);
    SortContests();
  }

  // What was moved, of each circle that contests were added for.
  const std::vector<FileIDs>& GetCircles() const { return circles_; }

  // Each step takes back a choice, a deletion or a place, of which there are finitely many.
  void Run() {
    do {
      plan_.Follow(contests_);
    } while (FixExcluded() || FixMissingOwner() || FixMissingFather() || FixCircle() || AddRequirements());
  }

 private:
  // The transforms and prefab instances that may hang elsewhere than in base, or on something else.
  void CollectNodes() {
    std::unordered_set<const YAMLScalar*> seen;
    const auto add = [&](const VexelObjects& objects, const YAMLScalar* file_id) {
      if (ReadLinks(objects.Get(file_id)).HasFather() && seen.insert(file_id).second)
        nodes_.push_back(file_id);
    };
    for (const SceneSide side : {SceneSide::kLeft, SceneSide::kRight}) {
      const SideChanges& changes = edits_.Changes(side);
      for (const YAMLScalar* file_id : changes.changed) add(edits_.Version(side), file_id);
      for (const YAMLScalar* file_id : changes.added) add(edits_.Version(side), file_id);
      for (const YAMLScalar* file_id : changes.removed) add(edits_.versions.base, file_id);
    }
  }

  void SortContests() {
    std::ranges::stable_sort(contests_, [](const Contest& a, const Contest& b) {
      return std::ranges::lexicographical_compare(a.path, b.path, ScalarTextLess());
    });
  }

  // A thing stands without what was moved below it, while another choice wants that moved. Where somebody
  // chose both, and the thing as it is in base, the thing is there to be moved below.
  bool FixExcluded() {
    bool has_changed = false;
    for (Contest& contest : contests_) {
      if (!contest.deleted || SourceOf(contest) == SourceOf(OtherSide(contest.deleted->by))) continue;
      for (const YAMLScalar* node : contest.deleted->moved_in) {
        const YAMLScalar* wanted = FatherIn(edits_.Version(OtherSide(contest.deleted->by)), node);
        for (Contest& other : contests_) {
          const bool moves = &other != &contest && Decides(other, node) && SourceOf(other) != Source::kNone &&
                             FatherIn(plan_.Version(SourceOf(other)), node) == wanted;
          const bool is_chosen =
              contest.IsSettled() && other.IsSettled() && SourceOf(contest) == Source::kBase;
          if (moves && !is_chosen) has_changed |= SettleExcluded(contest, other);
        }
      }
    }
    return has_changed;
  }

  // What is settled goes first, of two the first one. Returns whether something changed.
  static bool SettleExcluded(Contest& thing, Contest& move) {
    if (thing.IsSettled() && move.IsSettled()) {
      const bool is_thing_first = &thing < &move;
      return Retreat({is_thing_first ? &thing : &move, is_thing_first ? &move : &thing});
    }
    return StepBack(move.IsSettled() ? thing : move);
  }

  bool FixMissingFather() {
    for (const YAMLScalar* node : nodes_) {
      const YAMLScalar* father = plan_.GetFather(node);
      if (father == nullptr || !plan_.Has(node) || plan_.Has(father)) continue;
      if (AreBothWithout(father) && plan_.Restore(father)) return true;
      std::vector<Contest*> concerned;
      for (Contest& contest : contests_) {
        if (Places(contest, node) || Removes(contest, father)) concerned.push_back(&contest);
      }
      if (!WasThere(father)) continue;
      if (!BringBack(father, concerned)) plan_.Uproot(node);
      return true;
    }
    return false;
  }

  // Of what both sides added, one of them to something that the other deleted.
  bool FixMissingOwner() {
    for (Contest& contest : contests_) {
      if (!contest.is_about_owner || !plan_.Has(contest.node)) continue;
      const YAMLScalar* owner = plan_.GetOwner(contest.node);
      if (plan_.Has(owner)) continue;
      std::vector<Contest*> concerned;
      for (Contest& other : contests_) {
        if (&other == &contest || Removes(other, owner)) concerned.push_back(&other);
      }
      if (BringBack(owner, concerned)) return true;
    }
    return false;
  }

  // Whether what something is to hang on could be brought back, or that something elsewhere.
  bool BringBack(const YAMLScalar* file_id, const std::vector<Contest*>& concerned) {
    const bool is_contested =
        std::ranges::any_of(concerned, [&](const Contest* contest) { return Removes(*contest, file_id); });
    return (!is_contested && KeepDeleted(file_id)) || Retreat(concerned);
  }

  bool AreBothWithout(const YAMLScalar* file_id) const {
    return edits_.Deleted(SceneSide::kLeft).Find(file_id) != Deletions::kNone &&
           edits_.Deleted(SceneSide::kRight).Find(file_id) != Deletions::kNone;
  }

  bool WasThere(const YAMLScalar* file_id) const {
    const SceneVersions& versions = edits_.versions;
    return versions.base.HasKey(file_id) || versions.left.HasKey(file_id) || versions.right.HasKey(file_id);
  }

  // Whether a deletion could be taken back.
  bool KeepDeleted(const YAMLScalar* file_id) {
    bool is_kept = false;
    for (const SceneSide side : {SceneSide::kLeft, SceneSide::kRight}) {
      const size_t deletion = edits_.Deleted(side).Find(file_id);
      if (deletion != Deletions::kNone) is_kept |= plan_.Keep(side, deletion);
    }
    return is_kept;
  }

  // Of several choices the first one in the order of records is carried out: the last one is opened again. Of
  // one, those who haven't chosen make way. Returns whether something changed.
  static bool Retreat(const std::vector<Contest*>& concerned) {
    const auto settled =
        std::ranges::count_if(concerned, [](Contest* contest) { return contest->IsSettled(); });
    const auto makes_way = [](Contest* contest) { return !contest->IsSettled() && StepBack(*contest); };
    if (settled < 2 && std::ranges::any_of(concerned.rbegin(), concerned.rend(), makes_way)) return true;
    const auto last = std::find_if(concerned.rbegin(), concerned.rend(),
                                   [](Contest* contest) { return contest->IsSettled(); });
    if (last == concerned.rend()) return false;
    Contest& contest = **last;
    contest.resolution = MergeResolve::kConflict;
    StepBack(contest);
    const auto other = std::ranges::find_if(concerned, [&](const Contest* c) { return c != &contest; });
    contest.reason =
        other == concerned.end()
            ? "this choice can't be carried out, since something hangs on what it removes"
            : "this choice can't be carried out together with what stands at " + PathToString((*other)->path);
    return true;
  }

  // To the next version that may stand, base first. Returns false where there is none.
  static bool StepBack(Contest& contest) {
    contest.excluded.insert(contest.side);
    // Base has none, where both added.
    if (contest.type == ConflictType::kBothAdd) contest.excluded.insert(MergeResolve::kBase);
    for (const MergeResolve side : {MergeResolve::kBase, MergeResolve::kLeft, MergeResolve::kRight}) {
      if (contest.excluded.contains(side)) continue;
      contest.side = side;
      return true;
    }
    return false;
  }

  bool FixCircle() {
    const FileIDs circle = FindCircle();
    if (circle.empty()) return false;
    FileIDs moved;
    std::vector<Contest*> concerned;
    for (const YAMLScalar* node : circle) {
      if (!edits_.versions.base.HasKey(node) ||
          plan_.GetFather(node) == FatherIn(edits_.versions.base, node)) {
        continue;
      }
      const size_t before = concerned.size();
      for (Contest& contest : contests_) {
        if (Places(contest, node)) concerned.push_back(&contest);
      }
      if (concerned.size() == before) moved.push_back(node);
    }
    if (!moved.empty()) {
      AddCircle(moved);
    } else if (!Retreat(concerned)) {
      plan_.Uproot(circle.front());
    }
    return true;
  }

  // A component that requires another one is contested in its turn once that is to go.
  bool AddRequirements() {
    std::vector<Contest> added;
    for (const Contest& contest : contests_) {
      if (!contest.deleted || contest.deleted->deletion == Deletions::kNone) continue;
      for (const YAMLScalar* component : contest.deleted->requiring) {
        if (plan_.Has(contest.path.front()) || !required_.insert(component).second) continue;
        added.push_back(MakeRequirementContest(edits_, contest.deleted->by, component));
        Decide(resolver_, added.back());
      }
    }
    std::ranges::move(added, std::back_inserter(contests_));
    SortContests();
    return !added.empty();
  }

  // The nodes of one circle of fathers, empty where there is none. Every node is walked over once.
  FileIDs FindCircle() const {
    std::unordered_set<const YAMLScalar*> safe;
    for (const YAMLScalar* node : nodes_) {
      if (!plan_.Has(node)) continue;
      FileIDs walk;
      std::unordered_set<const YAMLScalar*> on_walk;
      const YAMLScalar* step = node;
      while (step != nullptr && !safe.contains(step) && on_walk.insert(step).second) {
        walk.push_back(step);
        step = plan_.Has(step) ? plan_.GetFather(step) : nullptr;
      }
      if (step != nullptr && !safe.contains(step) && !IsCircleInBase(step)) {
        return {std::ranges::find(walk, step), walk.end()};
      }
      safe.insert(walk.begin(), walk.end());
    }
    return {};
  }

  // What was broken before is nobody's conflict.
  bool IsCircleInBase(const YAMLScalar* node) const {
    const VexelObjects& base = edits_.versions.base;
    std::unordered_set<const YAMLScalar*> passed;
    const YAMLScalar* step = FatherIn(base, node);
    while (step != nullptr && step != node && passed.insert(step).second) step = FatherIn(base, step);
    return step == node;
  }

  const SceneEdits& edits_;
  const RecordingConflictResolver& resolver_;
  std::vector<Contest>& contests_;
  ScenePlan& plan_;
  FileIDs nodes_;
  std::vector<FileIDs> circles_;
  // The components whose requirements are contests already.
  std::unordered_set<const YAMLScalar*> required_;
};

bool IsVersion(MergeResolve resolve) {
  return resolve == MergeResolve::kBase || resolve == MergeResolve::kLeft || resolve == MergeResolve::kRight;
}

}  // namespace

void Decide(const RecordingConflictResolver& resolver, Contest& contest) {
  const MergeResolve found = resolver.FindResolution(contest.path);
  contest.resolution = IsVersion(found) ? found : MergeResolve::kConflict;
  contest.side = IsVersion(found)                       ? found
                 : IsVersion(resolver.GetDefaultSide()) ? resolver.GetDefaultSide()
                                                        : MergeResolve::kBase;
  // Base has none, and no object lacks its father.
  if (contest.type == ConflictType::kBothAdd && contest.side == MergeResolve::kBase) {
    contest.side = MergeResolve::kLeft;
  }
}

namespace {

// The circles that there are while nothing is settled: what people have seen when they chose.
std::vector<FileIDs> FindOpenCircles(const SceneEdits& edits, std::vector<Contest> contests) {
  const RecordingConflictResolver undecided(MergeResolve::kBase);
  for (Contest& contest : contests) Decide(undecided, contest);
  ScenePlan plan(edits);
  Reconciliation reconciliation(edits, undecided, contests, plan);
  reconciliation.Run();
  return reconciliation.GetCircles();
}

}  // namespace

void Reconcile(const SceneEdits& edits, const RecordingConflictResolver& resolver,
               std::vector<Contest>& contests, ScenePlan& plan) {
  std::vector<FileIDs> circles;
  if (!resolver.GetResolutions().empty()) circles = FindOpenCircles(edits, contests);
  for (Contest& contest : contests) Decide(resolver, contest);
  Reconciliation reconciliation(edits, resolver, contests, plan);
  // Other choices may leave no circle; what was chosen for one stands all the same.
  const auto is_chosen = [&](const YAMLScalar* node) {
    return IsVersion(resolver.FindResolution(FatherPath(node, edits.versions.base.Get(node))));
  };
  for (const FileIDs& circle : circles) {
    if (std::ranges::any_of(circle, is_chosen)) reconciliation.AddCircle(circle);
  }
  reconciliation.Run();
}

}  // namespace vexel_yaml
