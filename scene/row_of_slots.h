#pragma once

#include "scene/list_alignment.h"
#include "scene/value_settler.h"

namespace vexel_yaml {

/// Whether a side moved an element, or others past it, in whose place the other side put something: in a row
/// of slots that is another slot.
bool FillsWhatMoved(const ListAlignment& alignment);

/// Whether merging three lists index by index gives `merged`, too. Lists of references or scalars may be rows
/// of slots, and where nobody changed their length nothing tells that they are not. True for any others.
/// `settler` stands at the lists' path.
bool IsMergeOfSlots(const YAMLSequence& base, const YAMLSequence& left, const YAMLSequence& right,
                    const YAMLSequence& merged, ValueSettler& settler);

}  // namespace vexel_yaml
