#pragma once

#include <functional>

#include "merge/recording_conflict_resolver.h"
#include "scene/scene_versions.h"

namespace vexel_yaml {

/// Places below an object that somebody else settles.
using HandsOff = std::function<bool(const FieldPath& path)>;

/// Settles what both sides edited below one object, wherever the engine would let one edit win without a
/// word, lose one, double one or fail: such a place is made alike in all three versions. What is left to the
/// engine is one-sided edits and two different values at one place, on which it records a conflict by itself.
///
/// The same edit on both sides is taken once; the order of fields is no edit, both sides' orders are merged.
/// Lists that both sides changed are merged here, element by element; where it can't be told which element
/// is which, the whole list is one conflict. A conflict within a list is recorded at the element's index in
/// base, or at "+" and its index in left where base lacks it.
///
/// The resolver's path is the object's, one component. Places of which `hands_off` is true keep what each
/// version has. An object that only one side changed is left alone, save for lists whose change the engine
/// can't diff. The versions' hashes are right again on return.
void SettleValues(YAMLMapping& base, YAMLMapping& left, YAMLMapping& right, const HandsOff& hands_off,
                  RecordingConflictResolver& resolver);

/// Makes one object of those that both sides added under `file_id`, and puts it into all three versions.
/// Each value that differs is a conflict; base's part in it is left's, so that the object lacks no field.
/// Where `hands_off` is true left's stands without a conflict.
void SettleAddedObject(SceneVersions& versions, const YAMLScalar* file_id, const HandsOff& hands_off,
                       RecordingConflictResolver& resolver);

}  // namespace vexel_yaml
