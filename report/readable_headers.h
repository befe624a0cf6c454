#pragma once

#include <ostream>
#include <string>

namespace vexel_yaml {

/// Writes the text of an asset file with header lines that name the objects, such as
/// `--- Light &500302 of "Lamp"`; everything else byte for byte. A text that can't be read as an asset is
/// written as it is. Throws std::bad_alloc: a shortage of memory says nothing about the text.
void WriteWithReadableHeaders(std::ostream& out, const std::string& text);

}  // namespace vexel_yaml
