#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "merge/recording_conflict_resolver.h"
#include "report/object_names.h"
#include "report/override_names.h"

namespace vexel_yaml {

/// A conflict that nobody has settled, in the words of the people who are in it.
struct NamedConflict {
  /// A pattern for its path, and for no other.
  std::string place;
  /// The file ID of the game object or prefab instance that the place is in, or else of the object.
  std::string thing;
  /// Such as "Level01/Lamp Post > Light > m_Intensity"; no other one of the list has the same.
  std::string name;
  /// Base's value, or that it has none; empty for an object, and for a value that doesn't fit into a line.
  std::string was;
  /// What each side did, such as "4" or "removes it".
  std::string theirs;
  std::string ours;
  /// Base's content and both edits in full, by which the same conflict is known when it comes again.
  std::string edits;
};

/// The pending conflicts of a merge of these versions, in the order of its records. Where scripts and other
/// assets are among them, `search` is asked once.
std::vector<NamedConflict> NameConflicts(const RecordingConflictResolver& resolver,
                                         const ComparedVersions& versions, const AssetSearch& search);

/// The conflict in one line; the sides' own names stand in brackets where they have some.
std::string ConflictLine(const NamedConflict& conflict, std::string_view theirs, std::string_view ours);

}  // namespace vexel_yaml
