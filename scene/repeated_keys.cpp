#include "scene/repeated_keys.h"

#include <algorithm>
#include <set>
#include <string_view>
#include <unordered_set>

#include "fixups/duplicate_keys.h"
#include "fixups/engine_keys.h"
#include "rules/path_step.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

using MadeUpKeys = std::unordered_map<const YAMLScalar*, const YAMLScalar*>;

// The keys that lead to a mapping in its object, "*" for any element of a list.
using Place = std::vector<const YAMLScalar*>;

bool IsTransitions(const Place& place) {
  return place.size() == 2 && place[0] == AnimatorStateMachineKey() &&
         place[1] == StateMachineTransitionsKey();
}

template <typename Function>
void ForEachPair(const YAMLMapping& mapping, Function function) {
  if (mapping.HasDuplicateKeys()) {
    for (const YAMLMapping::Slot& slot : mapping.GetDuplicatePairs()) function(slot);
  } else {
    for (const YAMLMapping::Slot& slot : mapping) function(slot);
  }
}

// One object in all versions, while its pairs get their own keys.
class ObjectPairs {
 public:
  // What repeats keys, and which keys there are.
  void Collect(const YAMLNode& node) {
    if (const YAMLSequence* sequence = node.AsSequence()) {
      const PathStep step(place_, YAMLScalar::star);
      for (const YAMLNode* item : sequence->GetItems()) Collect(*item);
    }
    const YAMLMapping* mapping = node.AsMapping();
    if (mapping == nullptr) return;
    if (mapping->HasDuplicateKeys() && !IsTransitions(place_)) repeating_.insert(place_);
    ForEachPair(*mapping, [&](const YAMLMapping::Slot& slot) {
      keys_.insert(slot.key);
      const PathStep step(place_, slot.key);
      Collect(*slot.value);
    });
  }

  // What no writer could give its keys back: each object has one body, and a state machine one list of
  // transitions.
  bool RepeatsWhatMustBeUnique() const {
    return repeating_.contains({}) || repeating_.contains({AnimatorStateMachineKey()});
  }

  void MakeUnique(YAMLNode& node) {
    if (YAMLSequence* sequence = node.AsSequence()) {
      const PathStep step(place_, YAMLScalar::star);
      for (YAMLNode* item : sequence->GetItems()) MakeUnique(*item);
    }
    YAMLMapping* mapping = node.AsMapping();
    if (mapping == nullptr) return;
    // First, so that no "first" repeats keys.
    ForEachPair(*mapping, [&](const YAMLMapping::Slot& slot) {
      const PathStep step(place_, slot.key);
      MakeUnique(*slot.value);
    });
    if (!repeating_.contains(place_)) return;
    std::unordered_set<const YAMLScalar*> taken;
    for (const YAMLMapping::Slot& slot : mapping->TakePairs()) {
      mapping->Insert(OwnKey(slot, taken), slot.value);
    }
  }

  MadeUpKeys TakeMadeUpKeys() { return std::move(made_up_); }

 private:
  // The texts of all scalars in it. In record files a path ends at a blank, and its parts at dots.
  static void AppendIdentity(const YAMLNode& node, std::string& identity) {
    if (const YAMLScalar* scalar = node.AsScalar()) {
      if (!identity.ends_with('[')) identity += ',';
      const auto speaks = [](char c) { return static_cast<unsigned char>(c) > ' ' && c != '.' && c != 0x7F; };
      std::ranges::transform(scalar->GetText(), std::back_inserter(identity),
                             [&](char c) { return speaks(c) ? c : '_'; });
    } else if (const YAMLSequence* sequence = node.AsSequence()) {
      for (const YAMLNode* item : sequence->GetItems()) AppendIdentity(*item, identity);
    } else {
      for (const YAMLMapping::Slot& slot : *node.AsMapping()) AppendIdentity(*slot.value, identity);
    }
  }

  const YAMLScalar* OwnKey(const YAMLMapping::Slot& slot, std::unordered_set<const YAMLScalar*>& taken) {
    static const YAMLScalar* const first = YAMLScalar::Lookup("first");
    const YAMLMapping* value = slot.value->AsMapping();
    const YAMLNode* identity = value == nullptr ? nullptr : value->Get(first);
    const YAMLScalar* key = slot.key;
    if (identity != nullptr) {
      std::string text = slot.key->GetText() + '[';
      AppendIdentity(*identity, text);
      key = YAMLScalar::Lookup(text + ']');
    }
    const std::string stem = key->GetText();
    for (int number = 2; !Take(key, slot.key, taken); ++number) {
      key = YAMLScalar::Lookup(stem + '#' + std::to_string(number));
    }
    return key;
  }

  // False where a key stands for something else.
  bool Take(const YAMLScalar* own, const YAMLScalar* key, std::unordered_set<const YAMLScalar*>& taken) {
    if (taken.contains(own)) return false;
    if (own != key) {
      if (keys_.contains(own)) return false;
      if (made_up_.try_emplace(own, key).first->second != key) return false;
    }
    taken.insert(own);
    return true;
  }

  Place place_;
  std::set<Place> repeating_;
  std::unordered_set<const YAMLScalar*> keys_;
  MadeUpKeys made_up_;
};

void Restore(YAMLNode& node, const MadeUpKeys& made_up) {
  if (YAMLSequence* sequence = node.AsSequence()) {
    for (YAMLNode* item : sequence->GetItems()) {
      if (item != nullptr) Restore(*item, made_up);
    }
  }
  YAMLMapping* mapping = node.AsMapping();
  if (mapping == nullptr) return;
  bool has_own_keys = false;
  ForEachPair(*mapping, [&](const YAMLMapping::Slot& slot) {
    Restore(*slot.value, made_up);
    has_own_keys |= made_up.contains(slot.key);
  });
  if (!has_own_keys) return;
  for (const YAMLMapping::Slot& slot : mapping->TakePairs()) {
    const auto found = made_up.find(slot.key);
    mapping->AppendRepeated(found == made_up.end() ? slot.key : found->second, slot.value);
  }
}

}  // namespace

void RepeatedKeys::MakeUnique(const std::vector<FileToRead>& versions) {
  for (const FileToRead& file : versions) {
    for (const YAMLScalar* file_id : file.objects.GetObjectsWithDuplicateKeys()) {
      if (objects_.contains(file_id)) continue;
      ObjectPairs pairs;
      for (const FileToRead& version : versions) {
        const YAMLNode* object = version.objects.Get(file_id);
        if (object != nullptr) pairs.Collect(*object);
        if (pairs.RepeatsWhatMustBeUnique()) ThrowDuplicateKeys(version.path, file_id);
      }
      for (const FileToRead& version : versions) {
        YAMLMapping* object = GetSubmapping(version.objects, file_id);
        if (object == nullptr) continue;
        pairs.MakeUnique(*object);
        // That of a state machine can't be computed before its transitions are a list, and is then.
        if (!object->HasKey(AnimatorStateMachineKey())) object->RebuildHash(false);
      }
      objects_[file_id] = pairs.TakeMadeUpKeys();
    }
  }
}

void RepeatedKeys::Renumber(const std::vector<RenumberedObject>& objects) {
  for (const RenumberedObject& object : objects) {
    const auto found = objects_.find(object.old_id);
    if (found != objects_.end()) objects_.emplace(object.new_id, found->second);
  }
}

void RepeatedKeys::Restore(YAMLMapping& objects) const {
  for (const auto& [file_id, made_up] : objects_) {
    YAMLMapping* object = GetSubmapping(objects, file_id);
    if (object != nullptr && object->GetFolded() == nullptr) vexel_yaml::Restore(*object, made_up);
  }
}

}  // namespace vexel_yaml
