#include "yaml/murmur_hash.h"

#include <bit>
#include <cstring>

namespace vexel_yaml {

namespace {

uint32_t Scramble(uint32_t block) {
  block *= 0xCC9E2D51U;
  block = std::rotl(block, 15);
  return block * 0x1B873593U;
}

}  // namespace

uint32_t MurmurHash3(std::string_view text, uint32_t seed) {
  static_assert(std::endian::native == std::endian::little, "blocks are read as they lie in memory");
  uint32_t hash = seed;
  size_t offset = 0;
  for (; offset + 4 <= text.size(); offset += 4) {
    uint32_t block = 0;
    std::memcpy(&block, text.data() + offset, 4);
    hash = std::rotl(hash ^ Scramble(block), 13) * 5 + 0xE6546B64U;
  }
  uint32_t tail = 0;
  std::memcpy(&tail, text.data() + offset, text.size() - offset);
  hash ^= Scramble(tail);

  hash ^= static_cast<uint32_t>(text.size());
  hash ^= hash >> 16;
  hash *= 0x85EBCA6BU;
  hash ^= hash >> 13;
  hash *= 0xC2B2AE35U;
  return hash ^ (hash >> 16);
}

}  // namespace vexel_yaml
