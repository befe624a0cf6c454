#include "app/laws.h"

#include <algorithm>
#include <sstream>
#include <stdexcept>

#include "diff/strip_unchanged.h"
#include "diff/yaml_diff_output.h"
#include "diff/yaml_mapping_diff.h"
#include "merge/recording_conflict_resolver.h"
#include "yaml/yaml_sequence.h"

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
};

std::string Written(VexelObjects& scene) {
  std::ostringstream out;
  scene.Output(out);
  return out.str().substr(std::min(out.str().find("---"), out.str().size()));
}

// What a node holds, without the order of keys, elements and objects.
std::string Content(const YAMLNode* node) {
  if (node == nullptr) return "";
  if (const YAMLScalar* scalar = node->AsScalar()) return "'" + scalar->GetText() + "'";
  std::vector<std::string> parts;
  if (const YAMLMapping* mapping = node->AsMapping()) {
    for (const auto& [key, value] : *mapping) parts.push_back(key->GetText() + ": " + Content(value));
  } else {
    for (const YAMLNode* item : node->AsSequence()->GetItems()) parts.push_back(Content(item));
  }
  std::ranges::sort(parts);
  std::string text = node->AsMapping() != nullptr ? "{" : "[";
  for (const std::string& part : parts) text += part + ",\n";
  return text;
}

// A move survives only where the other side leaves the list, or the order of objects and fields, alone.
// Styles don't count: a list that was empty keeps its brackets.
bool AreSame(const VexelObjects& a, const VexelObjects& b, bool moved) {
  return moved ? Content(&a) == Content(&b) : a.HasSameContent(b);
}

// Whether both sides edited a list whose elements only one of them tells apart. Additions to it are paired
// when that one is left.
bool IsPairedOnOneSide(const Operation* left, const Operation* right) {
  if (left == nullptr || right == nullptr || left->GetKind() != right->GetKind()) return false;
  if (left->GetKind() == Operation::Kind::kChangeMapping) {
    const YAMLMappingDiff* other = static_cast<const ChangeMappingOperation*>(right)->GetDiff();
    return std::ranges::any_of(
        static_cast<const ChangeMappingOperation*>(left)->GetDiff()->GetEntries(),
        [&](const auto& entry) { return IsPairedOnOneSide(entry.operation, other->Get(entry.key)); });
  }
  if (left->GetKind() != Operation::Kind::kChangeSequence) return false;
  const auto is_set = [](const Operation* operation) {
    const auto* remapper = static_cast<const ChangeSequenceOperation*>(operation)->GetRemapper();
    return remapper != nullptr && remapper->IsSetRemapper();
  };
  return is_set(left) != is_set(right);
}

struct Merged {
  Merged(const VexelObjects& base, const VexelObjects& left, const VexelObjects& right)
      : scene(base.Clone()) {
    const auto* left_diff = YAMLMappingDiff::Diff(base, left);
    YAMLMappingDiff::Merge(*left_diff, *YAMLMappingDiff::Diff(base, right), resolver)->Apply(*scene);
  }

  // Whether a conflict is recorded at the path or above it.
  bool IsPendingAt(const FieldPath& path) const {
    return std::ranges::any_of(resolver.GetRecords(), [&](const auto& record) {
      return record.resolution == MergeResolve::kConflict && record.path.size() <= path.size() &&
             std::equal(record.path.begin(), record.path.end(), path.begin());
    });
  }

  RecordingConflictResolver resolver{MergeResolve::kBase};
  std::unique_ptr<VexelObjects> scene;
};

const YAMLNode* Child(const YAMLNode* node, const YAMLScalar* key) {
  return node == nullptr || node->AsMapping() == nullptr ? nullptr : node->AsMapping()->Get(key);
}

// Whether at some place below `path` only `side` differs from base, but the merged scene differs from `side`,
// without a conflict. Lists that both sides edited are not looked into.
bool IsAnythingLost(FieldPath& path, const YAMLNode* base, const YAMLNode* side, const YAMLNode* other,
                    const YAMLNode* found, const Merged& merged) {
  if (base == other || (base != nullptr && other != nullptr && base->HasSameContent(*other))) {
    return Content(side) != Content(found) && !merged.IsPendingAt(path);
  }
  if (side == nullptr || side->AsMapping() == nullptr || other == nullptr || other->AsMapping() == nullptr) {
    return false;
  }
  for (const YAMLNode* holder : {side, base}) {
    if (holder == nullptr || holder->AsMapping() == nullptr) continue;
    for (const auto& [key, value] : *holder->AsMapping()) {
      path.push_back(key);
      const bool lost = IsAnythingLost(path, Child(base, key), Child(side, key), Child(other, key),
                                       Child(found, key), merged);
      path.pop_back();
      if (lost) return true;
    }
  }
  return false;
}

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
        "a change of right alone is the result", "two equal changes give that change",
        "a result written and read again is equal",
        "every change of one side is in the result or in a record",
        "with left and right swapped the result holds the same",
        "the text of a diff is empty where nothing but an order changed, and only there",
        "stripping equal files leaves no object", "stripping keeps every object that was added or changed"}) {
    results_.push_back({law, 0, 0, ""});
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
  Expect(kApplying, applied->HasSameContent(side), triple);

  const auto expect_side = [&](Law law, const Merged& merged) {
    Expect(law, AreSame(*merged.scene, side, triple.moved), triple);
  };
  expect_side(kUnchangedRight, Merged(*triple.base, side, *triple.base));
  expect_side(kUnchangedLeft, Merged(*triple.base, *triple.base, side));
  expect_side(kEqualSides, Merged(*triple.base, side, side));

  // An order of keys is no change in the text, an order of elements is.
  const bool is_silent = DiffText(*triple.base, side).empty();
  Expect(kDiffText,
         is_silent ? Content(triple.base.get()) == Content(&side) : !triple.base->HasSameContent(side),
         triple);
  Expect(kStripEqual, Stripped(side, side)->Size() == 0, triple);
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

  FieldPath path;
  const YAMLNode* base = triple.base.get();
  const YAMLNode* left = triple.left.get();
  const YAMLNode* right = triple.right.get();
  Expect(kNothingLost,
         !IsAnythingLost(path, base, left, right, merged.scene.get(), merged) &&
             !IsAnythingLost(path, base, right, left, merged.scene.get(), merged),
         triple);
  // A removal on the right wins over an edit on the left, but the other way round they are a conflict.
  if (merged.resolver.HasPendingConflicts() || swapped.resolver.HasPendingConflicts() ||
      IsPairedOnOneSide(CreateDiffOperation(path, base, left), CreateDiffOperation(path, base, right))) {
    return;
  }
  Expect(kSwapped, Content(merged.scene.get()) == Content(swapped.scene.get()), triple);
}

bool Laws::Check(const SceneTriple& triple) {
  try {
    CheckSide(triple, *triple.left);
    CheckSide(triple, *triple.right);
    CheckBothSides(triple);
    return true;
  } catch (const std::length_error&) {
    return false;
  }
}

}  // namespace vexel_yaml
