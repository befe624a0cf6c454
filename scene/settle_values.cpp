#include "scene/settle_values.h"

#include "rules/path_step.h"
#include "scene/value_settler.h"

namespace vexel_yaml {

namespace {

bool AreOfOneClass(const YAMLMapping& a, const YAMLMapping& b) {
  return a.Get(YAMLScalar::classIDPlaceHolderName) == b.Get(YAMLScalar::classIDPlaceHolderName);
}

void BecomeCopyOf(const YAMLMapping& source, YAMLMapping& target) {
  if (&source == &target) return;
  const OwnedNodePtr<YAMLMapping> copy(source.Clone());
  target.Clear();
  for (const auto& [key, value] : *copy) target.Insert(key, value);
  copy->ForgetPairs();
}

// The fields of two classes are different fields, even where they have the same names.
void SettleClasses(YAMLMapping& base, YAMLMapping& left, YAMLMapping& right, ValueSettler& settler) {
  const MergeResolve side = settler.Decide(ConflictType::kBothChange, {&base, &left, &right});
  const YAMLMapping& chosen = side == MergeResolve::kLeft    ? left
                              : side == MergeResolve::kRight ? right
                                                             : base;
  for (YAMLMapping* version : {&base, &left, &right}) BecomeCopyOf(chosen, *version);
}

}  // namespace

void SettleValues(YAMLMapping& base, YAMLMapping& left, YAMLMapping& right, const HandsOff& hands_off,
                  RecordingConflictResolver& resolver) {
  ValueSettler settler(hands_off, resolver);
  if (!AreOfOneClass(left, right) && !settler.AreSame(&base, &left) && !settler.AreSame(&base, &right)) {
    SettleClasses(base, left, right, settler);
  } else {
    settler.SettleEntries({base, left, right});
  }
  for (YAMLMapping* version : {&base, &left, &right}) version->RebuildHash(false);
}

void SettleAddedObject(SceneVersions& versions, const YAMLScalar* file_id, const HandsOff& hands_off,
                       RecordingConflictResolver& resolver) {
  const YAMLMapping& left = *versions.left.GetRef(file_id).AsMapping();
  const YAMLMapping& right = *versions.right.GetRef(file_id).AsMapping();
  ValueSettler settler(hands_off, resolver);
  OwnedNode object;
  if (AreOfOneClass(left, right)) {
    object = settler.MergeAdditions(left, right);
  } else {
    const bool takes_right =
        settler.Decide(ConflictType::kBothAdd, {nullptr, &left, &right}) == MergeResolve::kRight;
    object = CopyOf(takes_right ? &right : &left);
  }
  object->RebuildHash(false);
  versions.SetObject(file_id, object.get());
}

}  // namespace vexel_yaml
