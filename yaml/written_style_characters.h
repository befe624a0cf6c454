#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <string_view>

/// What a character may be in the written style, by a table: a scene of 50 MB is gone through byte by byte.
namespace vexel_yaml::written_style {

inline constexpr uint8_t kDigit = 1;
// A character of a key.
inline constexpr uint8_t kKey = 2;
// A character that may stand inside a plain value in brackets, and at the start of any plain value.
inline constexpr uint8_t kFlow = 4;
inline constexpr uint8_t kFirst = 8;
// A character inside a plain value on a line of its own; a blank, a colon and a minus need a closer look.
inline constexpr uint8_t kBlock = 16;
inline constexpr uint8_t kColon = 32;
// Of the digits above 9 only those that libyaml writes.
inline constexpr uint8_t kHexadecimal = 64;

inline constexpr std::array<uint8_t, 256> kClasses = [] {
  std::array<uint8_t, 256> classes = {};
  const auto add = [&](std::string_view characters, uint8_t bits) {
    for (const char c : characters) classes[static_cast<uint8_t>(c)] |= bits;
  };
  for (int c = '!'; c <= '~'; ++c) classes[static_cast<size_t>(c)] = kBlock;
  classes[':'] = kColon;
  for (const std::string_view plain :
       {"ABCDEFGHIJKLMNOPQRSTUVWXYZ", "abcdefghijklmnopqrstuvwxyz", "0123456789", "_"}) {
    add(plain, kKey | kFlow | kFirst);
  }
  add("0123456789", kDigit | kHexadecimal);
  add("ABCDEF", kHexadecimal);
  add("./+()=;$^~<\\", kFlow | kFirst);
  add("-", kFlow);
  add(">", kFlow);
  add("<>.-$", kKey);
  return classes;
}();

inline bool Is(char c, uint8_t bits) { return (kClasses[static_cast<uint8_t>(c)] & bits) != 0; }

}  // namespace vexel_yaml::written_style
