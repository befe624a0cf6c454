#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace vexel_yaml {

/// A hash of the bytes of `text`, other in every process: whoever writes a file can't choose texts that
/// collide, so a table of its texts stays fast. Never to be stored or shown.
uint64_t HashText(std::string_view text);

/// For tables of texts.
struct TextHash {
  using is_transparent = void;
  size_t operator()(std::string_view text) const { return HashText(text); }
};

}  // namespace vexel_yaml
