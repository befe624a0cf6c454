#include "git/path_names.h"

#include <array>
#include <bit>
#include <cstdint>
#include <cstdio>
#include <span>

namespace vexel_yaml {

namespace {

// What git writes as a letter behind a backslash, and the letters.
constexpr std::string_view kSpecial = "\a\b\t\n\v\f\r\"\\";
constexpr std::string_view kLetters = "abtnvfr\"\\";

using Block = std::span<const unsigned char, 64>;
using State = std::array<uint32_t, 5>;

void AddBlock(Block block, State& state) {
  std::array<uint32_t, 80> words;
  for (size_t i = 0; i < 16; ++i) {
    words[i] = uint32_t{block[4 * i]} << 24U | uint32_t{block[4 * i + 1]} << 16U |
               uint32_t{block[4 * i + 2]} << 8U | uint32_t{block[4 * i + 3]};
  }
  for (size_t i = 16; i < words.size(); ++i) {
    words[i] = std::rotl(words[i - 3] ^ words[i - 8] ^ words[i - 14] ^ words[i - 16], 1);
  }
  auto [a, b, c, d, e] = state;
  for (size_t i = 0; i < words.size(); ++i) {
    const bool is_middle = i >= 40 && i < 60;
    const uint32_t mixed = i < 20 ? (b & c) | (~b & d) : is_middle ? (b & c) | (b & d) | (c & d) : b ^ c ^ d;
    const uint32_t constant = i < 20 ? 0x5A827999 : i < 40 ? 0x6ED9EBA1 : i < 60 ? 0x8F1BBCDC : 0xCA62C1D6;
    const uint32_t next = std::rotl(a, 5) + mixed + e + constant + words[i];
    e = d;
    d = c;
    c = std::rotl(b, 30);
    b = a;
    a = next;
  }
  state = {state[0] + a, state[1] + b, state[2] + c, state[3] + d, state[4] + e};
}

}  // namespace

std::string QuotedPath(std::string_view path) {
  std::string result;
  bool is_quoted = false;
  for (const char c : path) {
    const auto number = static_cast<unsigned char>(c);
    const size_t special = kSpecial.find(c);
    if (special == std::string_view::npos && number >= 0x20 && number < 0x7F) {
      result += c;
      continue;
    }
    is_quoted = true;
    result += '\\';
    if (special != std::string_view::npos) {
      result += kLetters[special];
    } else {
      for (const unsigned shift : {6U, 3U, 0U}) result += static_cast<char>('0' + ((number >> shift) & 7U));
    }
  }
  return is_quoted ? '"' + result + '"' : result;
}

std::string UnquotedPath(std::string_view text) {
  if (text.size() < 2 || text.front() != '"' || text.back() != '"') return std::string(text);
  text = text.substr(1, text.size() - 2);
  std::string path;
  for (size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '\\' || i + 1 == text.size()) {
      path += text[i];
    } else if (const size_t letter = kLetters.find(text[++i]); letter != std::string_view::npos) {
      path += kSpecial[letter];
    } else {
      unsigned number = 0;
      for (size_t end = i + 3; i < end && i < text.size(); ++i) number = number * 8 + (text[i] - '0');
      --i;
      path += static_cast<char>(number);
    }
  }
  return path;
}

std::string HashedPath(std::string_view path) {
  std::string text = "blob " + std::to_string(path.size()) + '\0';
  text += path;
  const uint64_t bits = uint64_t{text.size()} * 8;
  text += '\x80';
  while (text.size() % 64 != 56) text += '\0';
  for (int shift = 56; shift >= 0; shift -= 8) text += static_cast<char>(bits >> shift);
  State state = {0x67452301, 0xEFCDAB89, 0x98BADCFE, 0x10325476, 0xC3D2E1F0};
  const std::span bytes(reinterpret_cast<const unsigned char*>(text.data()), text.size());
  for (size_t at = 0; at < bytes.size(); at += 64) AddBlock(Block(bytes.subspan(at, 64)), state);
  std::array<char, 41> name;
  std::snprintf(name.data(), name.size(), "%08x%08x%08x%08x%08x", state[0], state[1], state[2], state[3],
                state[4]);
  return name.data();
}

}  // namespace vexel_yaml
