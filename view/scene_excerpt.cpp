#include "view/scene_excerpt.h"

#include <array>
#include <unordered_set>
#include <vector>

#include "fixups/reference_search.h"
#include "scene/object_links.h"
#include "scene/side_changes.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;

class ExcerptMaker {
 public:
  explicit ExcerptMaker(const SceneDocuments& whole) : versions_{&whole.base, &whole.left, &whole.right} {}

  std::unordered_set<const YAMLScalar*> Choose() {
    const FileIDs edited = FindEdited();
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
  FileIDs FindEdited() {
    FileIDs edited;
    FileIDs vanishing;
    for (const VexelObjects* side : {versions_[1], versions_[2]}) {
      const SideChanges changes = FindChanges(*versions_[0], *side);
      for (const FileIDs* file_ids : {&changes.removed, &changes.changed, &changes.added}) {
        for (const YAMLScalar* file_id : *file_ids) {
          if (kept_.insert(file_id).second) edited.push_back(file_id);
        }
        if (file_ids != &changes.changed)
          vanishing.insert(vanishing.end(), file_ids->begin(), file_ids->end());
      }
    }
    const ReferenceSearch search(vanishing);
    for (const auto& [file_id, object] : *versions_[0]) {
      const bool refers = !vanishing.empty() && search.MayRefer(*object);
      if (refers && kept_.insert(file_id).second) edited.push_back(file_id);
    }
    return edited;
  }

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

void MakeExcerpt(const SceneDocuments& whole, SceneDocuments& excerpt) {
  std::unordered_set<const YAMLScalar*> kept;
  {
    // A look at an object unfolds it, and what is unfolded in one version alone counts as edited.
    const std::unique_ptr<SceneDocuments> looked_at = whole.Copy();
    kept = ExcerptMaker(*looked_at).Choose();
  }
  const std::unique_ptr<SceneDocuments> trimmed = whole.Copy();
  for (VexelObjects* version : {&trimmed->base, &trimmed->left, &trimmed->right}) {
    FileIDs dropped;
    for (const auto& [file_id, object] : *version) {
      if (!kept.contains(file_id)) dropped.push_back(file_id);
    }
    for (const YAMLScalar* file_id : dropped) version->Remove(file_id);
  }
  // Copied once more, it has no gaps.
  trimmed->CopyTo(excerpt);
}

}  // namespace vexel_yaml
