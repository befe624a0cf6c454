#pragma once

#include <string>
#include <unordered_map>
#include <vector>

#include "fixups/file_id_collisions.h"
#include "yaml/read_files.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Mappings that repeat keys, on their way through a merge.
///
/// Engines write maps so, each pair under the key "data", but such mappings can be neither copied nor
/// compared nor edited. Lists of pairs, as for the transitions of state machines, would have to be matched
/// wherever lists are. So each pair gets a key of its own instead, and then merges key by key as in any
/// mapping, under a path that tells people which pair is meant: "data[_MainTex]" for the pair that holds
/// "_MainTex" as "first", however deep, and "data", "data#2" for those that hold no "first".
class RepeatedKeys {
 public:
  /// Gives every pair its own key in each mapping that repeats one in one of the versions, and in what stands
  /// in its place in the others (any element of a list counts as the place). Not in the transitions of state
  /// machines. Throws YAMLError where an object or the body of a state machine repeats a key.
  void MakeUnique(const std::vector<FileToRead>& versions);

  /// Has to be told which objects get other file IDs after that.
  void Renumber(const std::vector<RenumberedObject>& objects);

  /// Gives the pairs of an edited version or a merged one their keys back, in the order they are in.
  void Restore(YAMLMapping& objects) const;

 private:
  /// From a key that was made up to the one that the pair had. None of them stands as a key anywhere else in
  /// the object, in any version.
  using MadeUpKeys = std::unordered_map<const YAMLScalar*, const YAMLScalar*>;

  std::unordered_map<const YAMLScalar*, MadeUpKeys> objects_;
};

}  // namespace vexel_yaml
