#include <algorithm>
#include <memory>
#include <vector>

#include "diff/mergeable_mapping.h"
#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"
#include "rules/path_step.h"
#include "rules/scalar_tolerance.h"
#include "yaml/content_digests.h"
#include "yaml/folded_object.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

bool IsMergeable(const FieldPath& path, const YAMLNode* node) {
  bool matched = false;
  return YAMLSequenceRemapper::IsMergeablePath(path, node, matched);
}

Operation* DiffScalars(const FieldPath& path, const YAMLScalar& from, const YAMLScalar& to) {
  if (AreSameScalars(path, from, to)) return nullptr;
  return YAMLAlloc<ChangeOperation>::create(&to);
}

// The fields of a script object belong to its script: with another script they are other fields.
bool IsScriptReplaced(const FieldPath& path, const YAMLMappingDiff& diff) {
  return path.size() == 2 && path[1] == YAMLScalar::monoBehaviour && diff.HasKey(YAMLScalar::mScript);
}

// The elements of `from` where `remapper` puts them, without touching `from`.
std::vector<YAMLNode*> Rearranged(const YAMLSequence& from, const YAMLSequenceRemapper& remapper) {
  std::vector<YAMLNode*> items(remapper.GetDestinationCount(), nullptr);
  const std::vector<uint32_t>& mapping = remapper.GetMapping();
  for (size_t i = 0; i < mapping.size(); ++i) {
    if (mapping[i] != YAMLSequenceRemapper::kDropped) items[mapping[i]] = from.GetItems()[i];
  }
  return items;
}

bool HaveSameKeys(const YAMLMapping& from, const YAMLMapping& to) {
  return from.Size() == to.Size() &&
         std::equal(from.begin(), from.end(), to.begin(),
                    [](const YAMLMapping::Slot& a, const YAMLMapping::Slot& b) { return a.key == b.key; });
}

OwnedNodePtr<YAMLSequence> KeySequence(const YAMLMapping& mapping) {
  OwnedNodePtr<YAMLSequence> keys(YAMLAlloc<YAMLSequence>::create(false));
  keys->Reserve(mapping.Size());
  for (const auto& [key, value] : mapping) keys->Append(key->AsValue());
  return keys;
}

// Folded objects have no hashes.
void Unfold(const YAMLNode& node) {
  if (node.AsMapping() != nullptr) node.AsMapping()->Unfold();
}

// Makes one diff.
class DiffMaker {
 public:
  // `path` is where the diff starts; it is the same again afterwards.
  explicit DiffMaker(FieldPath& path) : path_(path) {}

  Operation* Diff(const YAMLNode* from, const YAMLNode* to) {
    if (from == to) return nullptr;
    if (to == nullptr) return YAMLAlloc<RemoveOperation>::create(IsMergeable(path_, from));
    if (from == nullptr) return YAMLAlloc<AddOperation>::create(to, IsMergeable(path_, to));
    // Before the hashes: an empty list and an empty mapping have the same one.
    if (from->GetKind() != to->GetKind()) return YAMLAlloc<ChangeOperation>::create(to);
    if (HaveSameText(*from, *to)) return nullptr;
    Unfold(*from);
    Unfold(*to);
    // Scalars are compared as they are, which costs no more than their hashes.
    if (from->AsScalar() == nullptr && from->GetHash() == to->GetHash() && HaveSameContent(*from, *to))
      return nullptr;
    switch (from->GetKind()) {
      case YAMLNode::Kind::kScalar:
        return DiffScalars(path_, *from->AsScalar(), *to->AsScalar());
      case YAMLNode::Kind::kMapping:
        return DiffNestedMappings(*from->AsMapping(), *to->AsMapping());
      case YAMLNode::Kind::kSequence:
        return DiffSequences(*from->AsSequence(), *to->AsSequence());
    }
    throw YAMLError("Cannot diff unknown yaml value");
  }

  YAMLMappingDiff* DiffMappings(const YAMLMapping& from, const YAMLMapping& to) {
    auto* diff = YAMLAlloc<YAMLMappingDiff>::create();
    for (const auto& [key, value] : from) {
      const PathStep step(path_, key);
      if (Operation* operation = Diff(value, to.Get(key))) diff->Add(key, operation);
    }
    for (const auto& [key, value] : to) {
      if (from.HasKey(key)) continue;
      const PathStep step(path_, key);
      diff->Add(key, YAMLAlloc<AddOperation>::create(value, IsMergeable(path_, value)));
    }
    diff->SetKeyOrder(DiffKeyOrder(from, to));
    return diff;
  }

  YAMLSequenceDiff* DiffItems(std::span<YAMLNode* const> from, std::span<YAMLNode* const> to) {
    auto* diff = YAMLAlloc<YAMLSequenceDiff>::create();
    const size_t count = std::max(from.size(), to.size());
    for (size_t i = 0; i < count; ++i) {
      const YAMLNode* a = i < from.size() ? from[i] : nullptr;
      const YAMLNode* b = i < to.size() ? to[i] : nullptr;
      if (a == b) continue;
      const PathStep step(path_, YAMLScalar::Lookup(IntToString(static_cast<int>(i))));
      if (Operation* operation = Diff(a, b)) diff->Add(static_cast<int>(i), operation);
    }
    return diff;
  }

 private:
  // Whether two nodes with equal hashes are equal. What is, is not looked at again. What isn't is compared
  // once more with every level below: nested deeply, and made so that all their hashes are equal, two files
  // would take the square of their size. So from the first such pair on, digests tell which ones differ.
  bool HaveSameContent(const YAMLNode& from, const YAMLNode& to) {
    if (hashes_mislead_ && digests_.Of(&from) != digests_.Of(&to)) return false;
    if (from.HasSameContent(to)) return true;
    hashes_mislead_ = true;
    return false;
  }

  Operation* DiffNestedMappings(const YAMLMapping& from, const YAMLMapping& to) {
    // What can't be compared key by key is shown as a whole.
    if (from.HasDuplicateKeys() || to.HasDuplicateKeys()) return YAMLAlloc<ChangeOperation>::create(&to);
    YAMLMappingDiff* diff = DiffMappings(from, to);
    // A nested mapping whose keys were only reordered counts as unchanged.
    if (diff->GetEntries().empty()) {
      YAMLAlloc<YAMLMappingDiff>::free(diff);
      return nullptr;
    }
    const bool mergeable = IsMergeableMapping(path_, from, to) && !IsScriptReplaced(path_, *diff);
    return YAMLAlloc<ChangeMappingOperation>::create(diff, mergeable);
  }

  Operation* DiffSequences(const YAMLSequence& from, const YAMLSequence& to) {
    YAMLSequenceRemapper* remapper = YAMLSequenceRemapper::FindMapping(path_, from, to);
    YAMLSequenceDiff* diff = nullptr;
    if (remapper != nullptr) {
      diff = DiffItems(Rearranged(from, *remapper), to.GetItems());
    } else {
      diff = DiffItems(from.GetItems(), to.GetItems());
      if (diff->GetEntries().empty()) {
        YAMLAlloc<YAMLSequenceDiff>::free(diff);
        return nullptr;
      }
    }
    return YAMLAlloc<ChangeSequenceOperation>::create(diff, remapper, IsMergeable(path_, &to));
  }

  static ChangeSequenceOperation* DiffKeyOrder(const YAMLMapping& from, const YAMLMapping& to) {
    if (!HaveSameKeys(from, to)) {
      FieldPath path = {YAMLScalar::underscore};
      // Scalars own themselves, so the operation outlives the two key lists.
      return static_cast<ChangeSequenceOperation*>(
          DiffMaker(path).DiffSequences(*KeySequence(from), *KeySequence(to)));
    }
    return YAMLAlloc<ChangeSequenceOperation>::create(
        YAMLAlloc<YAMLSequenceDiff>::create(),
        YAMLSequenceRemapper::CreateIdentity(static_cast<uint32_t>(from.Size())), true);
  }

  FieldPath& path_;
  ContentDigests digests_;
  bool hashes_mislead_ = false;
};

}  // namespace

Operation* CreateDiffOperation(FieldPath& path, const YAMLNode* from, const YAMLNode* to) {
  return DiffMaker(path).Diff(from, to);
}

YAMLMappingDiff* YAMLMappingDiff::Diff(FieldPath& path, const YAMLMapping& from, const YAMLMapping& to) {
  return DiffMaker(path).DiffMappings(from, to);
}

YAMLMappingDiff* YAMLMappingDiff::Diff(const YAMLMapping& from, const YAMLMapping& to) {
  FieldPath path;
  return Diff(path, from, to);
}

YAMLSequenceDiff* YAMLSequenceDiff::Diff(FieldPath& path, std::span<YAMLNode* const> from,
                                         std::span<YAMLNode* const> to) {
  return DiffMaker(path).DiffItems(from, to);
}

}  // namespace vexel_yaml
