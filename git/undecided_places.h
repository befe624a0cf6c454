#pragma once

#include <string>
#include <vector>

#include "git/asset_merge.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// What is undecided in the common ancestor that git makes of several. Nothing that stands there is what
/// anybody has chosen, and neither side may win by having changed it: where the sides differ, people are
/// asked. The text of such an ancestor ends with a list of these places, which git stores with it.

/// The text with a list of what is pending in the merge behind it, and of what was undecided in the versions.
std::string WithUndecidedPlaces(const AssetMerge& merge, const AssetVersions& versions);

/// Takes the lists off the files, and gives base values that neither side has wherever these differ at a
/// place that was listed. They end with `versions.mark`, which nothing else does then; where nothing was
/// listed, it is empty. What can't be read is left to the merge to complain about.
void MarkUndecided(AssetVersions& versions);

/// Takes the marks out of a merged asset: what is in conflict has base's.
void RemoveMarks(VexelObjects& merged, const std::string& mark);

}  // namespace vexel_yaml
