#include "app/laws.h"

#include <algorithm>
#include <sstream>
#include <stdexcept>

#include "app/lost_edits.h"
#include "app/safe_laws.h"
#include "diff/strip_unchanged.h"
#include "diff/yaml_diff_output.h"
#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"
#include "merge/recording_conflict_resolver.h"

namespace vexel_yaml {

namespace {

enum Law : size_t {
  kApplying,
  kUnchangedLeft,
  kUnchangedRight,
  kEqualSides,
  kReadAgain,
  kNothingLost,
  kSwapped,
  kDiffText,
  kStripEqual,
  kStripKeeps,
  kSafeEqualSides,
  kSafeSound,
};

std::string Written(VexelObjects& scene) {
  std::ostringstream out;
  scene.Output(out);
  return out.str().substr(std::min(out.str().find("---"), out.str().size()));
}

// A move survives only where the other side leaves the list, or the order of objects and fields, alone.
// Styles don't count: a list that was empty keeps its brackets.
bool AreSame(const VexelObjects& a, const VexelObjects& b, bool moved) {
  return moved ? Content(&a) == Content(&b) : a.HasSameContent(b);
}

// Whether some place in which both sides did something to a list is as `judge` says, given left's and right's
// edit and the list's path.
template <typename Judge>
bool AnyListOfBoth(FieldPath& path, const Operation* left, const Operation* right, const Judge& judge) {
  if (left == nullptr || right == nullptr || left->GetKind() != right->GetKind()) return false;
  if (left->GetKind() == Operation::Kind::kChangeMapping) {
    const YAMLMappingDiff* other = static_cast<const ChangeMappingOperation*>(right)->GetDiff();
    return std::ranges::any_of(
        static_cast<const ChangeMappingOperation*>(left)->GetDiff()->GetEntries(), [&](const auto& entry) {
          path.push_back(entry.key);
          const bool found = AnyListOfBoth(path, entry.operation, other->Get(entry.key), judge);
          path.pop_back();
          return found;
        });
  }
  return left->GetKind() == Operation::Kind::kChangeSequence &&
         judge(static_cast<const ChangeSequenceOperation&>(*left),
               static_cast<const ChangeSequenceOperation&>(*right), path);
}

bool IsSet(const ChangeSequenceOperation& edit) {
  return edit.GetRemapper() != nullptr && edit.GetRemapper()->IsSetRemapper();
}

// Additions are paired where left's elements have keys; of two edits that count as equal left's is taken.
bool DependsOnSide(const ChangeSequenceOperation& left, const ChangeSequenceOperation& right,
                   const FieldPath& /*path*/) {
  return IsSet(left) != IsSet(right) || OperationEquals(left, right);
}

// What both add to a list without keys is there twice, unless the list is left to the default keys.
bool AddsTwice(const ChangeSequenceOperation& left, const ChangeSequenceOperation& /*right*/,
               const FieldPath& path) {
  const bool adds = std::ranges::any_of(left.GetDiff()->GetEntries(), [](const auto& entry) {
    return entry.second->GetKind() == Operation::Kind::kAdd;
  });
  return adds && !IsSet(left) &&
         YAMLSequenceRemapper::ChooseKeyPaths(path) != YAMLSequenceRemapper::defaultPath;
}

struct Merged {
  Merged(const VexelObjects& base, const VexelObjects& left, const VexelObjects& right)
      : scene(base.Clone()) {
    const auto* left_diff = YAMLMappingDiff::Diff(base, left);
    YAMLMappingDiff::Merge(*left_diff, *YAMLMappingDiff::Diff(base, right), resolver)->Apply(*scene);
  }

  RecordingConflictResolver resolver{MergeResolve::kBase};
  std::unique_ptr<VexelObjects> scene;
};

std::string DiffText(const VexelObjects& from, const VexelObjects& to) {
  std::ostringstream out;
  YAMLDiffOutput text(out, 2);
  YAMLMappingDiff::Diff(from, to)->Output(text);
  return out.str();
}

std::unique_ptr<VexelObjects> Stripped(const VexelObjects& from, const VexelObjects& to) {
  std::unique_ptr<VexelObjects> stripped(to.Clone());
  StripUnchanged(*stripped, *YAMLMappingDiff::Diff(from, *stripped));
  return stripped;
}

bool HoldsAllChanged(const VexelObjects& stripped, const VexelObjects& from, const VexelObjects& to) {
  for (const auto& [key, object] : to) {
    if (!stripped.HasKey(key) && Content(from.Get(key)) != Content(object)) return false;
  }
  return true;
}

}  // namespace

Laws::Laws() {
  for (const char* law :
       {"applying the diff of a version to base gives that version", "a change of left alone is the result",
        "a change of right alone is the result",
        "two equal changes give that change, but for additions to lists without keys",
        "a result written and read again is equal",
        "every change of one side is in the result or in a record, but for list edits that a merge counts "
        "as equal",
        "with left and right swapped the result holds the same, but for conflicts and for lists that are "
        "merged by left's keys or count as equally edited",
        "the text of a diff is empty where nothing but an order changed, and only there",
        "stripping equal files leaves no object", "stripping keeps every object that was added or changed",
        "a safe merge of two equal changes gives that change",
        "a safe merge breaks nothing that was whole, unless a conflict says so"}) {
    results_.push_back({law, 0, 0, 0, ""});
  }
}

void Laws::Expect(size_t law, bool holds, const SceneTriple& triple) {
  Result& result = results_[law];
  ++result.checked;
  if (holds) return;
  ++result.broken;
  std::string example = "base\n" + Written(*triple.base) + "left\n" + Written(*triple.left) + "right\n" +
                        Written(*triple.right);
  if (result.example.empty() || example.size() < result.example.size()) result.example = std::move(example);
}

void Laws::CheckSide(const SceneTriple& triple, VexelObjects& side) {
  const std::unique_ptr<VexelObjects> applied(triple.base->Clone());
  YAMLMappingDiff::Diff(*triple.base, side)->Apply(*applied);
  // Fields that only changed places inside of an object are no change, and stay where base has them.
  const bool is_side =
      Content(applied.get()) == Content(&side) && YAMLMappingDiff::Diff(*applied, side)->GetEntries().empty();
  Expect(kApplying, is_side, triple);

  const auto expect_side = [&](Law law, const Merged& merged) {
    Expect(law, AreSame(*merged.scene, side, triple.moved), triple);
  };
  expect_side(kUnchangedRight, Merged(*triple.base, side, *triple.base));
  expect_side(kUnchangedLeft, Merged(*triple.base, *triple.base, side));
  FieldPath path;
  const Operation* edit = CreateDiffOperation(path, triple.base.get(), &side);
  if (AnyListOfBoth(path, edit, edit, AddsTwice)) {
    ++results_[kEqualSides].excused;
  } else {
    expect_side(kEqualSides, Merged(*triple.base, side, side));
  }

  // An order of keys is no change in the text, an order of elements is.
  const bool is_silent = DiffText(*triple.base, side).empty();
  Expect(kDiffText,
         is_silent ? Content(triple.base.get()) == Content(&side) : !triple.base->HasSameContent(side),
         triple);
  Expect(kStripEqual, Stripped(side, side)->Size() == 0, triple);
  Expect(kSafeEqualSides, TakesEqualEditsOnce(*triple.base, side), triple);
  Expect(kStripKeeps, HoldsAllChanged(*Stripped(*triple.base, side), *triple.base, side), triple);
}

void Laws::CheckBothSides(const SceneTriple& triple) {
  const Merged merged(*triple.base, *triple.left, *triple.right);
  const Merged swapped(*triple.base, *triple.right, *triple.left);
  const auto read = ReadScene(Written(*merged.scene));
  merged.scene->RebuildHash(false);
  Expect(kReadAgain,
         read->GetHash() == merged.scene->GetHash() && Content(read.get()) == Content(merged.scene.get()),
         triple);

  const auto loses = [&](const VexelObjects& side, const VexelObjects& other) {
    return IsAnythingLost(*triple.base, side, other, *merged.scene, merged.resolver,
                          &results_[kNothingLost].excused);
  };
  Expect(kNothingLost, !loses(*triple.left, *triple.right) && !loses(*triple.right, *triple.left), triple);
  Expect(kSafeSound, KeepsSceneSound(triple), triple);
  FieldPath path;
  const Operation* left = CreateDiffOperation(path, triple.base.get(), triple.left.get());
  const Operation* right = CreateDiffOperation(path, triple.base.get(), triple.right.get());
  // A removal on the right wins over an edit on the left, but the other way round they are a conflict.
  if (merged.resolver.HasPendingConflicts() || swapped.resolver.HasPendingConflicts() ||
      AnyListOfBoth(path, left, right, DependsOnSide)) {
    ++results_[kSwapped].excused;
    return;
  }
  Expect(kSwapped, Content(merged.scene.get()) == Content(swapped.scene.get()), triple);
}

std::string Laws::Check(const SceneTriple& triple) {
  try {
    CheckSide(triple, *triple.left);
    CheckSide(triple, *triple.right);
    CheckBothSides(triple);
    return {};
  } catch (const std::length_error& error) {
    return error.what();
  }
}

}  // namespace vexel_yaml
