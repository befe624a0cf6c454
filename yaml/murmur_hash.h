#pragma once

#include <cstdint>
#include <string_view>

namespace vexel_yaml {

/// MurmurHash3 for x86, 32-bit variant (Austin Appleby, public domain) of the bytes of `text`.
uint32_t MurmurHash3(std::string_view text, uint32_t seed);

}  // namespace vexel_yaml
