#pragma once

#include "diff/yaml_mapping_diff.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// Takes out of a file everything that `diff`, which leads from another file to this one, does not touch.
/// Changed objects keep their pseudo keys and, inside, the fields that the diff adds or changes; lists that
/// changed stay whole.
void StripUnchanged(VexelObjects& objects, const YAMLMappingDiff& diff);

/// The same for one mapping. The pseudo keys for file ID and class are always kept, the stripped mark is
/// dropped like any key.
void StripUnchangedMapping(YAMLMapping& mapping, const YAMLMappingDiff& diff);

}  // namespace vexel_yaml
