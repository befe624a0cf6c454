#pragma once

#include "scene/list_alignment.h"
#include "scene/value_settler.h"

namespace vexel_yaml {

/// Whether a side moved an element, or others past it, in whose place the other side put something: in a row
/// of slots that is another slot.
bool FillsWhatMoved(const ListAlignment& alignment);

/// Whether an element that neither side has any more may stand elsewhere, edited by one of them: without keys
/// it looks like one that both removed beside one that was added, and both sides' edits of it would stand as
/// two elements. `settler` stands at the lists' path.
bool EditsWhatMoved(const ListAlignment& alignment, const YAMLSequence& base, const YAMLSequence& left,
                    const YAMLSequence& right, ValueSettler& settler);

}  // namespace vexel_yaml
