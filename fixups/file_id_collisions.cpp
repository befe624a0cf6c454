#include "fixups/file_id_collisions.h"

#include <algorithm>
#include <string>
#include <unordered_map>

#include "fixups/reference_search.h"
#include "fixups/state_machine_transitions.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// A small range on purpose: a file that is that crowded is better looked at by a person.
constexpr uint32_t kCandidates = 19;

// From old to new file ID.
using Renumbering = std::unordered_map<const YAMLScalar*, const YAMLScalar*>;

// Rewrites the references of one file that point at renumbered objects.
class PreProcessRemapAddCollisionsVisitor final : public YAMLNodeVisitor {
 public:
  explicit PreProcessRemapAddCollisionsVisitor(const Renumbering& renumbering) : renumbering_(renumbering) {}

  void Visit(const YAMLScalar& /*scalar*/) override {}

  void Visit(YAMLMapping& mapping) override {
    for (const auto& [key, value] : mapping) {
      const YAMLScalar* scalar = value->AsScalar();
      if (scalar == nullptr) {
        value->Accept(*this);
      } else if (key == YAMLScalar::fileID) {
        Rewrite(mapping, scalar);
      }
    }
  }

  void Visit(YAMLSequence& sequence) override {
    for (YAMLNode* item : sequence.GetItems()) {
      if (item != nullptr) item->Accept(*this);
    }
  }

  // Whether anything was rewritten since the last question.
  bool TakeChanged() { return std::exchange(changed_, false); }

 private:
  // A reference with a "guid" points into another file.
  void Rewrite(YAMLMapping& reference, const YAMLScalar* file_id) {
    const auto found = renumbering_.find(file_id);
    if (found == renumbering_.end() || reference.HasKey(YAMLScalar::guid)) return;
    reference.Change(YAMLScalar::fileID, found->second->AsValue());
    changed_ = true;
  }

  const Renumbering& renumbering_;
  bool changed_ = false;
};

// Whether two objects that both sides added are taken for the same one and merged into one.
bool AreOne(const YAMLMapping& left, const YAMLMapping& right, SameObject same) {
  if (left.FirstKey() != right.FirstKey()) return false;
  const YAMLScalar* const mark = YAMLScalar::strippedPrefabPlaceHolderName;
  return same == SameObject::kSameClass || left.HasKey(mark) == right.HasKey(mark);
}

// The first of the file IDs behind `file_id` that nothing uses.
const YAMLScalar* FindFree(const YAMLScalar* file_id, const AllFileIDs& all) {
  const auto value = static_cast<uint32_t>(file_id->GetIntValue());
  for (uint32_t i = 1; i <= kCandidates; ++i) {
    const auto candidate = static_cast<int32_t>(value + i);
    const YAMLScalar* text = YAMLScalar::Lookup(std::to_string(candidate));
    if (all.Contains(text)) continue;
    if (candidate == -1) break;
    return text;
  }
  throw YAMLError("Cannot create new fileID for conflicting fileID: " + file_id->GetText());
}

// The diff compares by hash, so an edited object's must be up to date.
void Renumber(const std::vector<RenumberedObject>& renumbered, YAMLMapping& root) {
  Renumbering renumbering;
  std::vector<const YAMLScalar*> old_ids;
  for (const auto& [old_id, new_id] : renumbered) {
    renumbering.emplace(old_id, new_id);
    old_ids.push_back(old_id);
    root.ChangeKey(old_id, new_id);
    YAMLMapping* object = root.Get(new_id)->AsMapping();
    object->Change(YAMLScalar::fileIDPlaceHolderName, new_id->AsValue());
    object->RebuildHash(false);
  }
  const ReferenceSearch search(old_ids);
  PreProcessRemapAddCollisionsVisitor visitor(renumbering);
  for (const auto& [file_id, object] : root) {
    if (!search.MayRefer(*object)) continue;
    object->Accept(visitor);
    if (visitor.TakeChanged()) object->RebuildHash(false);
  }
  root.RebuildHash(true);
}

}  // namespace

bool AllFileIDs::Contains(const YAMLScalar* file_id) const {
  // 0 is the null reference.
  return file_id == YAMLScalar::zero || given_out_.contains(file_id) ||
         std::ranges::any_of(files_, [&](const FileIDSet& file) { return file.Contains(file_id); });
}

FileIDSet PreProcess(YAMLMapping& root) {
  TransitionsToSequences(root);
  return FileIDSet(root);
}

ConflictingFileIDs CreateConflictingFileIDsRemapper(FileIDSet base, FileIDSet left, FileIDSet right) {
  ConflictingFileIDs ids = {{}, AllFileIDs(base, left, right)};
  for (const auto& [file_id, object] : left) {
    if (!base.Contains(file_id) && right.Contains(file_id)) ids.conflicting.insert(file_id);
  }
  return ids;
}

std::vector<RenumberedObject> RemapCollidingAddFileIDs(ConflictingFileIDs& ids, const YAMLMapping& left_root,
                                                       YAMLMapping& right_root, SameObject same) {
  std::vector<RenumberedObject> renumbered;
  for (const YAMLScalar* file_id : ids.conflicting) {
    const YAMLNode* left = left_root.Get(file_id);
    if (AreOne(*left->AsMapping(), *right_root.Get(file_id)->AsMapping(), same)) continue;
    renumbered.push_back({file_id, FindFree(file_id, ids.all)});
    ids.all.Insert(renumbered.back().new_id);
  }
  if (!renumbered.empty()) Renumber(renumbered, right_root);
  return renumbered;
}

}  // namespace vexel_yaml
