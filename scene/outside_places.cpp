#include "scene/outside_places.h"

#include <algorithm>
#include <iterator>
#include <map>

#include "fixups/reference_search.h"
#include "scene/object_links.h"
#include "scene/place_walk.h"

namespace vexel_yaml {

namespace {

using FileIDs = std::vector<const YAMLScalar*>;

bool IsEmptyReference(const YAMLNode* node) {
  const YAMLMapping* reference = node == nullptr ? nullptr : node->AsMapping();
  return reference != nullptr && reference->Size() == 1 && reference->HasKey(YAMLScalar::fileID) &&
         GetLocalTarget(reference) == nullptr;
}

// What is to stand with the deleter in the place of an entry or reference of base that it took out or
// cleared: the same where what it stands for stays, else what the other side put there. Null for nothing.
const YAMLNode* Restored(const YAMLNode* before, const YAMLNode* instead, const IsSought& stays,
                         const IsSought& goes) {
  if (TargetOf(before, stays) != nullptr) return before;
  const auto goes_with = [&](const YAMLNode* reference) {
    const YAMLScalar* target = GetLocalTarget(reference);
    return target != nullptr && goes(target);
  };
  return instead != nullptr && goes_with(before) && !goes_with(instead) ? instead : nullptr;
}

// Puts entries that the deleter's list lacks back behind those that precede them in base.
bool BringBack(const ListPlace& list, const IsSought& stays, const IsSought& goes) {
  std::map<int64_t, std::vector<YAMLNode*>> behind;
  int64_t previous = -1;
  bool is_changed = false;
  for (const AlignedElement& element : list.elements) {
    if (element.base == kNoIndex) continue;
    const bool is_there = element.left != kNoIndex;
    if (is_there) previous = element.left;
    if (is_there && !IsEmptyReference(list.deleter.GetItems()[element.left])) continue;
    const bool is_in_other = list.other != nullptr && element.right != kNoIndex;
    const YAMLNode* restored =
        Restored(list.base.GetItems()[element.base],
                 is_in_other ? list.other->GetItems()[element.right] : nullptr, stays, goes);
    if (restored == nullptr) continue;
    is_changed = true;
    if (is_there) {
      list.deleter.Set(static_cast<int>(element.left), restored->Clone())->Free();
    } else {
      behind[previous].push_back(restored->Clone());
    }
  }
  if (behind.empty()) return is_changed;
  std::vector<YAMLNode*> items = behind[-1];
  for (size_t index = 0; index < list.deleter.Size(); ++index) {
    items.push_back(list.deleter.GetItems()[index]);
    const std::vector<YAMLNode*>& followers = behind[static_cast<int64_t>(index)];
    items.insert(items.end(), followers.begin(), followers.end());
  }
  list.deleter.SwapItems(std::move(items));
  return true;
}

// Takes back what the other side did to entries of base that the deleter took out: from then on it is the
// deleter alone that decides on them.
bool Revert(const ListPlace& list, const IsSought& is_sought) {
  bool is_changed = false;
  for (const AlignedElement& element : list.elements) {
    if (element.base == kNoIndex || element.left != kNoIndex || element.right == kNoIndex) continue;
    const YAMLNode* before = list.base.GetItems()[element.base];
    if (TargetOf(before, is_sought) == nullptr) continue;
    if (IsAnotherReference(before, list.other->GetItems()[element.right])) continue;
    list.other->Set(static_cast<int>(element.right), before->Clone())->Free();
    is_changed = true;
  }
  return is_changed;
}

// Takes new entries out of the other side's list that are nothing but a reference. In the place of one that
// filled a slot stands again what base has there. (Of others the reference is cleared, and the rest stays.)
bool TakeOut(const ListPlace& list, const IsSought& is_sought) {
  std::vector<YAMLNode*> items = list.other->GetItems();
  bool is_changed = false;
  const auto refers = [&](const YAMLNode* entry) {
    const YAMLScalar* target = GetLocalTarget(entry);
    return target != nullptr && is_sought(target);
  };
  for (const AlignedElement& element : list.elements) {
    const bool is_added = element.base == kNoIndex;
    if (element.right == kNoIndex || (is_added && element.left != kNoIndex)) continue;
    YAMLNode*& entry = items[element.right];
    const YAMLNode* before = is_added ? nullptr : list.base.GetItems()[element.base];
    if (!refers(entry) || GetLocalTarget(before) == GetLocalTarget(entry)) continue;
    entry->Free();
    entry = before == nullptr || refers(before) ? nullptr : before->Clone();
    is_changed = true;
  }
  std::erase(items, nullptr);
  list.other->SwapItems(std::move(items));
  return is_changed;
}

// Takes the entries out of all lists at and below a node that are nothing but a sought reference.
bool TakeOutBelow(YAMLNode* node, const IsSought& is_sought) {
  if (node == nullptr) return false;
  bool is_changed = false;
  if (YAMLMapping* mapping = node->AsMapping()) {
    for (const auto& [key, value] : *mapping) is_changed |= TakeOutBelow(value, is_sought);
  } else if (YAMLSequence* list = node->AsSequence()) {
    std::vector<YAMLNode*> items;
    for (YAMLNode* item : list->GetItems()) {
      const YAMLScalar* target = GetLocalTarget(item);
      if (target != nullptr && is_sought(target)) {
        item->Free();
      } else {
        is_changed |= TakeOutBelow(item, is_sought);
        items.push_back(item);
      }
    }
    is_changed |= items.size() < list->Size();
    list->SwapItems(std::move(items));
  }
  return is_changed;
}

}  // namespace

OutsidePlaces::OutsidePlaces(const SceneEdits& edits, const ScenePlan& plan) {
  for (const SceneSide side : {SceneSide::kLeft, SceneSide::kRight}) {
    const SideChanges& changes = edits.Changes(side);
    const SideChanges& other_changes = edits.Changes(OtherSide(side));
    Fate& fate = fates_[static_cast<size_t>(side)];
    for (const YAMLScalar* file_id : changes.removed) {
      if (other_changes.Removed(file_id)) continue;
      fate.removed.push_back(file_id);
      (plan.Has(file_id) ? fate.staying : fate.going).insert(file_id);
      const auto planned = plan.GetObjects().find(file_id);
      if (planned != plan.GetObjects().end() && planned->second == ScenePlan::Source::kBase) {
        fate.as_in_base.insert(file_id);
      }
    }
    for (const YAMLScalar* file_id : other_changes.added) {
      if (plan.Has(file_id)) {
        fate.added_by_other.push_back(file_id);
      } else {
        fate.going.insert(file_id);
      }
    }
    fate.changed_by_deleter = changes.changed;
    fate.changed_by_other = other_changes.changed;
    std::ranges::copy_if(changes.changed, std::back_inserter(fate.changed_by_both),
                         [&](const YAMLScalar* file_id) { return other_changes.Changed(file_id); });
  }
}

void OutsidePlaces::Settle(const SceneVersions& versions) const {
  for (const Fate& fate : fates_) {
    if (fate.going.empty()) continue;
    // What the deleter doesn't have would have lost these entries with the rest that it deleted.
    const IsSought goes = [&](const YAMLScalar* target) { return fate.going.contains(target); };
    const ReferenceSearch search(FileIDs(fate.going.begin(), fate.going.end()));
    FileIDs file_ids = fate.added_by_other;
    file_ids.insert(file_ids.end(), fate.staying.begin(), fate.staying.end());
    for (const YAMLScalar* file_id : file_ids) {
      for (VexelObjects* version : {&versions.base, &versions.left, &versions.right}) {
        YAMLNode* object = version->Get(file_id);
        if (object == nullptr || !search.MayRefer(*object)) continue;
        if (TakeOutBelow(GetBody(object), goes)) object->RebuildHash(false);
      }
    }
  }
  SettleFate(fates_[0], versions.base, versions.left, versions.right);
  SettleFate(fates_[1], versions.base, versions.right, versions.left);
}

void OutsidePlaces::SettleFate(const Fate& fate, const VexelObjects& base, VexelObjects& deleter,
                               VexelObjects& other) {
  if (fate.staying.empty() && fate.going.empty()) return;
  bool deleter_changed = false;
  bool other_changed = false;
  const IsSought stays = [&](const YAMLScalar* target) { return fate.staying.contains(target); };
  const IsSought loses_edits = [&](const YAMLScalar* target) {
    return fate.going.contains(target) || fate.as_in_base.contains(target);
  };
  const IsSought goes = [&](const YAMLScalar* target) { return fate.going.contains(target); };
  PlaceWalk walk([&](const YAMLScalar* target) { return stays(target) || goes(target); },
                 [&](const YAMLMapping& reference, YAMLMapping& now, const YAMLMapping* instead) {
                   if (!IsEmptyReference(&now)) return;
                   const YAMLNode* restored = Restored(&reference, instead, stays, goes);
                   if (restored == nullptr) return;
                   now.Clear();
                   restored->AsMapping()->CloneInto(now);
                   deleter_changed = true;
                 },
                 [&](const ListPlace& list) {
                   deleter_changed |= BringBack(list, stays, goes);
                   if (list.other == nullptr) return;
                   other_changed |= Revert(list, loses_edits);
                   other_changed |= TakeOut(list, goes);
                 });
  const auto settle = [&](const YAMLScalar* file_id) {
    YAMLNode* in_deleter = deleter.Get(file_id);
    YAMLNode* in_other = other.Get(file_id);
    deleter_changed = other_changed = false;
    walk.Walk(file_id, base.Get(file_id), in_deleter, in_other);
    if (deleter_changed) in_deleter->RebuildHash(false);
    if (other_changed) in_other->RebuildHash(false);
  };
  const FileIDs going(fate.going.begin(), fate.going.end());
  const ReferenceSearch was_there(fate.removed);
  const ReferenceSearch is_to_go(going);
  // (Where nothing stays, what the deleter alone did stands.)
  for (const YAMLScalar* file_id : fate.staying.empty() ? fate.changed_by_both : fate.changed_by_deleter) {
    const YAMLNode* object = base.Get(file_id);
    if (object != nullptr && was_there.MayRefer(*object)) settle(file_id);
  }
  for (const YAMLScalar* file_id : fate.changed_by_other) {
    const YAMLNode* object = other.Get(file_id);
    if (object != nullptr && is_to_go.MayRefer(*object)) settle(file_id);
  }
}

}  // namespace vexel_yaml
