#pragma once

#include <set>
#include <vector>

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Orders file IDs by their texts, byte by byte: "10" comes before "9".
using FileIDCompare = ScalarTextLess;
using FileIDSet = std::set<const YAMLScalar*, FileIDCompare>;

/// An object that got another file ID.
struct RenumberedObject {
  const YAMLScalar* old_id;
  const YAMLScalar* new_id;
};

/// The file IDs of objects that both sides added to base.
FileIDSet FindCollidingAdditions(const YAMLMapping& base, const YAMLMapping& left, const YAMLMapping& right);

/// Gives every colliding object of `right` that is of another class than left's a file ID of its own, and
/// rewrites the references to it within the file. Hashes of edited objects are rebuilt. Returns these
/// objects. Throws YAMLError "Cannot create new fileID for conflicting fileID: " + ID.
std::vector<RenumberedObject> RemapCollidingAddFileIDs(const FileIDSet& conflicting, const YAMLMapping& base,
                                                       const YAMLMapping& left, YAMLMapping& right);

}  // namespace vexel_yaml
