#pragma once

#include <string>
#include <string_view>

namespace vexel_yaml {

/// The path as git quotes it in its lists, with `core.quotePath`: a line break in a name is none in the list.
std::string QuotedPath(std::string_view path);

/// The path that such a text, quoted or not, stands for.
std::string UnquotedPath(std::string_view text);

/// A name for files of ours that belong to this path, in 40 letters: SHA-1 of git's blob with that content.
std::string HashedPath(std::string_view path);

}  // namespace vexel_yaml
