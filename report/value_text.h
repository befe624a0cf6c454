#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "diff/operation.h"
#include "report/object_names.h"

namespace vexel_yaml {

/// What a shortened text ends with.
inline constexpr std::string_view kEllipsis = "...";

/// The text, cut between two characters and ended with kEllipsis where it is longer than `most` bytes.
std::string Shortened(std::string_view text, size_t most);

/// The text with blanks for line breaks, control characters and those that make a text look like another one
/// (such as a change of direction), U+FFFD for what is not UTF-8. Several blanks in a row become one.
std::string OnOneLine(std::string_view text);

/// The text with U+FFFD for what is not UTF-8 and for what OnOneLine takes out, other than tabs and line
/// breaks.
std::string Cleaned(std::string_view text);

/// A value as it could stand in a file, on one line; the name of the object stands beside a reference to it.
/// Shortened as by Shortened. A null pointer is nothing.
std::string ValueText(const YAMLNode* value, ObjectNames& names, size_t most);

/// What stands beside names in a text for people.
enum class NamedWith { kNothing, kFileIDs };

/// A value for people: what references lead to goes by its name, as far as that is known. The elements of a
/// list stand on a line each.
std::string NamedText(const YAMLNode* value, ObjectNames& names, NamedWith with = NamedWith::kNothing);

/// The elements of a list for people, each on one line; those of one name have their file IDs beside it. The
/// text of an empty slot is empty.
std::vector<std::string> NamedElements(const YAMLSequence& list, ObjectNames& names,
                                       NamedWith with = NamedWith::kNothing);

/// What an operation does, on one line of about 60 bytes at most.
std::string OperationText(const Operation& operation);

}  // namespace vexel_yaml
