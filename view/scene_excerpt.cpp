#include "view/scene_excerpt.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <unordered_set>
#include <vector>

#include "fixups/reference_search.h"
#include "scene/object_links.h"
#include "scene/scene_versions.h"
#include "scene/side_changes.h"
#include "yaml/folded_object.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;

class ExcerptMaker {
 public:
  explicit ExcerptMaker(const SceneDocuments& whole) : versions_{&whole.base, &whole.left, &whole.right} {}

  std::unordered_set<const YAMLScalar*> Choose(const FileIDs& edited) {
    kept_.insert(edited.begin(), edited.end());
    for (const YAMLScalar* file_id : edited) {
      AddReferences(file_id);
      AddHolders(file_id);
    }
    // A list of children or components follows from where its elements hang.
    for (const YAMLScalar* holder : FileIDs(holders_.begin(), holders_.end())) {
      for (const YAMLScalar* member : AddReferences(holder)) AddHolders(member);
    }
    // Whether something hangs below itself shows only at the top.
    for (FileIDs added(kept_.begin(), kept_.end()); !added.empty();) {
      FileIDs above;
      for (const YAMLScalar* file_id : added) {
        for (const VexelObjects* version : versions_) {
          const YAMLScalar* father = FatherIn(*version, file_id);
          if (father != nullptr && kept_.insert(father).second) above.push_back(father);
        }
      }
      added = std::move(above);
    }
    return std::move(kept_);
  }

 private:
  FileIDs AddReferences(const YAMLScalar* file_id) {
    FileIDs targets;
    for (const VexelObjects* version : versions_) {
      // Reading references changes nothing.
      VisitReferences(const_cast<YAMLNode*>(version->Get(file_id)), [&](YAMLMapping& reference) {
        targets.push_back(GetLocalTarget(&reference));
        kept_.insert(targets.back());
      });
    }
    return targets;
  }

  // What the object is a part of, or hangs on.
  void AddHolders(const YAMLScalar* file_id) {
    for (const VexelObjects* version : versions_) {
      const ObjectLinks links = ReadLinks(version->Get(file_id));
      for (const YAMLScalar* holder : {links.owner, links.father}) {
        if (holder == nullptr) continue;
        kept_.insert(holder);
        holders_.insert(holder);
      }
    }
  }

  const std::array<const VexelObjects*, 3> versions_;
  std::unordered_set<const YAMLScalar*> kept_;
  std::unordered_set<const YAMLScalar*> holders_;
};

}  // namespace

FileIDs FindEdited(const SceneDocuments& scene) {
  FileIDs edited;
  FileIDs vanishing;
  std::unordered_set<const YAMLScalar*> seen;
  for (const SideChanges& changes :
       {FindChanges(scene.base, scene.left), FindChanges(scene.base, scene.right)}) {
    for (const FileIDs* file_ids : {&changes.removed, &changes.changed, &changes.added}) {
      std::ranges::copy_if(*file_ids, std::back_inserter(edited),
                           [&](const YAMLScalar* file_id) { return seen.insert(file_id).second; });
      if (file_ids != &changes.changed) vanishing.insert(vanishing.end(), file_ids->begin(), file_ids->end());
    }
  }
  const ReferenceSearch search(vanishing);
  for (const auto& [file_id, object] : scene.base) {
    const bool refers = !vanishing.empty() && search.MayRefer(*object);
    if (refers && seen.insert(file_id).second) edited.push_back(file_id);
  }
  return edited;
}

void MakeExcerpt(const SceneDocuments& whole, const FileIDs& edited, SceneDocuments& excerpt) {
  std::unordered_set<const YAMLScalar*> kept;
  {
    const std::unique_ptr<SceneDocuments> looked_at = whole.Copy();
    kept = ExcerptMaker(*looked_at).Choose(edited);
  }
  const std::unique_ptr<SceneDocuments> trimmed = whole.Copy();
  for (VexelObjects* version : {&trimmed->base, &trimmed->left, &trimmed->right}) {
    FileIDs dropped;
    for (const auto& [file_id, object] : *version) {
      if (!kept.contains(file_id)) dropped.push_back(file_id);
    }
    for (const YAMLScalar* file_id : dropped) version->Remove(file_id);
  }
  for (const YAMLScalar* file_id : edited) kept.erase(file_id);
  for (const YAMLScalar* file_id : kept) {
    const YAMLNode* object = trimmed->base.Get(file_id);
    for (VexelObjects* side : {&trimmed->left, &trimmed->right}) {
      const bool is_edited =
          object != nullptr && side->HasKey(file_id) && !HaveSameText(*object, side->GetRef(file_id));
      if (is_edited) SetEntry(*side, file_id, object->Clone());
    }
  }
  std::erase_if(trimmed->renumbered, [&](const RenumberedObject& object) {
    return !trimmed->base.HasKey(object.new_id) && !trimmed->left.HasKey(object.new_id) &&
           !trimmed->right.HasKey(object.new_id);
  });
  // Copied once more, it has no gaps.
  trimmed->CopyTo(excerpt);
}

}  // namespace vexel_yaml
