#pragma once

#include <optional>
#include <string>

#include "merge/recording_conflict_resolver.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// The versions that were merged, with what each side has made of base.
struct ComparedVersions {
  const VexelObjects& base;
  const VexelObjects& left;
  const VexelObjects& right;
  /// Whether they were merged as scenes. Then records count a list's elements as base has them, with a "+" as
  /// left does; else as a merged list does, which none of the versions has.
  bool are_scenes;
};

/// What an entry in a prefab instance's list of overrides is about.
struct NamedOverride {
  /// Such as "m_LocalPosition.x of 400002": the property, and the file ID in the prefab.
  std::string name;
  /// What base has at the record's place; null for nothing.
  const YAMLNode* base_value;
};

/// The override that a record is about. Nothing for a record about something else, or for one whose place in
/// the list can't be told.
std::optional<NamedOverride> OverrideAt(const RecordingConflictResolver::Record& record,
                                        const ComparedVersions& versions);

}  // namespace vexel_yaml
