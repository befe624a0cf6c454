#include "platform/text_hash.h"

#include <sys/random.h>
#include <unistd.h>

#include <array>
#include <bit>
#include <chrono>
#include <cstring>

namespace vexel_yaml {

namespace {

struct Key {
  uint64_t low;
  uint64_t high;
};

Key MakeKey() {
  Key key = {};
  if (getentropy(&key, sizeof key) == 0) return key;
  // Still not the same in every process.
  key.low = static_cast<uint64_t>(std::chrono::steady_clock::now().time_since_epoch().count());
  key.high = reinterpret_cast<uintptr_t>(&key) ^ (static_cast<uint64_t>(getpid()) << 48);
  return key;
}

// SipHash-1-3 (Aumasson and Bernstein): as fast as an unkeyed hash for short texts, and made for tables whose
// keys an attacker chooses. A seed alone is not enough: of simpler hashes there are collisions for every
// seed.
class SipHash {
 public:
  explicit SipHash(const Key& key)
      : v_{key.low ^ 0x736F6D6570736575U, key.high ^ 0x646F72616E646F6DU, key.low ^ 0x6C7967656E657261U,
           key.high ^ 0x7465646279746573U} {}

  void Add(uint64_t block) {
    v_[3] ^= block;
    Round();
    v_[0] ^= block;
  }

  uint64_t Finish() {
    v_[2] ^= 0xFF;
    for (int i = 0; i < 3; ++i) Round();
    return v_[0] ^ v_[1] ^ v_[2] ^ v_[3];
  }

 private:
  void Round() {
    v_[0] += v_[1];
    v_[2] += v_[3];
    v_[1] = std::rotl(v_[1], 13) ^ v_[0];
    v_[3] = std::rotl(v_[3], 16) ^ v_[2];
    v_[0] = std::rotl(v_[0], 32) + v_[3];
    v_[2] += v_[1];
    v_[3] = std::rotl(v_[3], 21) ^ v_[0];
    v_[1] = std::rotl(v_[1], 17) ^ v_[2];
    v_[2] = std::rotl(v_[2], 32);
  }

  std::array<uint64_t, 4> v_;
};

}  // namespace

uint64_t HashText(std::string_view text) {
  static const Key key = MakeKey();
  SipHash hash(key);
  size_t offset = 0;
  for (; offset + 8 <= text.size(); offset += 8) {
    uint64_t block = 0;
    std::memcpy(&block, text.data() + offset, 8);
    hash.Add(block);
  }
  uint64_t tail = 0;
  if (offset < text.size()) std::memcpy(&tail, text.data() + offset, text.size() - offset);
  hash.Add(tail | static_cast<uint64_t>(text.size()) << 56);
  return hash.Finish();
}

}  // namespace vexel_yaml
