#pragma once

#include <string>
#include <vector>

#include "merge/recording_conflict_resolver.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// For each of the user's resolutions that fits nothing which this merge decided, a line for people that
/// names its path and the nearest one there is, an object's of `merged` or one that was decided about. Paths
/// made of wildcards alone are meant for whatever there is. Of many only the first ones are named.
std::vector<std::string> DescribeUnmatchedChoices(const RecordingConflictResolver& resolver,
                                                  const VexelObjects& merged);

}  // namespace vexel_yaml
