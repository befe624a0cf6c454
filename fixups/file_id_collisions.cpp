#include "fixups/file_id_collisions.h"

#include <string>
#include <unordered_map>
#include <vector>

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

const YAMLScalar* ClassName(const YAMLMapping& root, const YAMLScalar* file_id) {
  const YAMLMapping* object = root.Get(file_id)->AsMapping();
  return object->FirstKey();
}

}  // namespace

FileIDSet FindCollidingAdditions(const YAMLMapping& base, const YAMLMapping& left, const YAMLMapping& right) {
  FileIDSet colliding;
  for (const auto& [file_id, object] : left) {
    if (!base.HasKey(file_id) && right.HasKey(file_id)) colliding.insert(file_id);
  }
  return colliding;
}

std::vector<RenumberedObject> RemapCollidingAddFileIDs(const FileIDSet& conflicting, const YAMLMapping& base,
                                                       const YAMLMapping& left, YAMLMapping& right) {
  Renumbering renumbering;
  FileIDSet taken;
  // 0 is the null reference.
  const auto in_use = [&](const YAMLScalar* file_id) {
    return file_id == YAMLScalar::zero || base.HasKey(file_id) || left.HasKey(file_id) ||
           right.HasKey(file_id) || taken.contains(file_id);
  };
  const auto find_free = [&](const YAMLScalar* file_id) {
    const auto value = static_cast<uint32_t>(file_id->GetIntValue());
    for (uint32_t i = 1; i <= kCandidates; ++i) {
      const auto candidate = static_cast<int32_t>(value + i);
      const YAMLScalar* text = YAMLScalar::Lookup(std::to_string(candidate));
      if (in_use(text)) continue;
      if (candidate == -1) break;
      return text;
    }
    throw YAMLError("Cannot create new fileID for conflicting fileID: " + file_id->GetText());
  };

  std::vector<RenumberedObject> renumbered;
  for (const YAMLScalar* file_id : conflicting) {
    // Of one class, the two are taken for the same object and merged into one.
    if (ClassName(left, file_id) == ClassName(right, file_id)) continue;
    const YAMLScalar* new_id = find_free(file_id);
    taken.insert(new_id);
    renumbering.emplace(file_id, new_id);
    renumbered.push_back({file_id, new_id});
  }
  if (renumbered.empty()) return renumbered;

  for (const auto& [old_id, new_id] : renumbered) {
    right.ChangeKey(old_id, new_id);
    YAMLMapping* object = right.Get(new_id)->AsMapping();
    object->Change(YAMLScalar::fileIDPlaceHolderName, new_id->AsValue());
    object->RebuildHash(false);
  }
  // The diff compares by hash, so an edited object's must be up to date.
  PreProcessRemapAddCollisionsVisitor visitor(renumbering);
  for (const auto& [file_id, object] : right) {
    object->Accept(visitor);
    if (visitor.TakeChanged()) object->RebuildHash(false);
  }
  right.RebuildHash(true);
  return renumbered;
}

}  // namespace vexel_yaml
