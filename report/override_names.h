#pragma once

#include <optional>
#include <string>

#include "merge/recording_conflict_resolver.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// What an entry in a prefab instance's list of overrides is about.
struct NamedOverride {
  /// Such as "m_LocalPosition.x of 400002": the property, and the file ID in the prefab.
  std::string name;
  /// What base has at the record's place; null for nothing.
  const YAMLNode* base_value;
};

/// Whether a record of this path is about one, or a part of it.
bool IsInOverride(const FieldPath& path);

/// The override that a record is about, in versions that still have what both sides made of it. Nothing for a
/// record about something else, or for one whose place in the list can't be told: its index is that of a
/// merged list, which none of the versions has.
std::optional<NamedOverride> OverrideAt(const RecordingConflictResolver::Record& record,
                                        const VexelObjects& base, const VexelObjects& left,
                                        const VexelObjects& right);

}  // namespace vexel_yaml
