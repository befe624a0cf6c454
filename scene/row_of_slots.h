#pragma once

#include "scene/value_settler.h"

namespace vexel_yaml {

/// Whether merging three lists index by index gives `merged`, too. Lists of references or scalars may be rows
/// of slots, and where nobody changed their length nothing tells that they are not. True for any others.
/// `settler` stands at the lists' path.
bool IsMergeOfSlots(const YAMLSequence& base, const YAMLSequence& left, const YAMLSequence& right,
                    const YAMLSequence& merged, ValueSettler& settler);

}  // namespace vexel_yaml
