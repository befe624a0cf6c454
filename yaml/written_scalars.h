#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

#include "yaml/written_style_characters.h"

/// Keys and values in the written style. All functions rely on a line break or a null character at the end of
/// the text.
namespace vexel_yaml::written_style {

// libyaml breaks a line at a blank, and a collection in brackets before an entry, beyond this column.
inline constexpr ptrdiff_t kBestWidth = 80;
// A longer key is written as "? key".
inline constexpr ptrdiff_t kLongestKey = 128;

inline bool EndsWord(char c) { return c == ' ' || c == '\n' || c == '\0'; }

/// Steps over a key that is written without quotes; false where none starts.
inline bool StepOverKey(const char*& at) {
  if (!Is(*at, kKey) || *at == '-' || *at == '.' || *at == '>') return false;
  const char* begin = at;
  while (Is(*at, kKey)) ++at;
  return at - begin <= kLongestKey;
}

/// Steps over the first character of a plain value; false where it means something.
inline bool StepOverPlainStart(const char*& at) {
  if (*at == '-') {
    if (!Is(at[1], kFlow) || at[1] == '-') return false;
  } else if (!Is(*at, kFirst)) {
    return false;
  }
  if (at[0] == '.' && at[1] == '.') return false;
  ++at;
  return true;
}

/// Where a plain value on a line of its own has its next blank, its end, or a character that is none of it.
inline const char* SkipPlainWord(const char* at) {
  for (;; ++at) {
    while (Is(*at, kBlock)) ++at;
    if (*at != ':' || EndsWord(at[1])) return at;
  }
}

/// Whether the blank at `at` may stand inside a plain value: before another one, before a comment and at the
/// end it would mean something else.
inline bool IsInsidePlain(const char* at) { return *at == ' ' && !EndsWord(at[1]) && at[1] != '#'; }

/// Whether the blank at `at` stays one: not at the end of the line, nor where the line would be broken.
inline bool IsPlainBlank(const char* at, const char* line) {
  return at[1] != '\n' && at - line <= kBestWidth;
}

/// A value in quotes. This and the functions below are given where the value begins and where its line does,
/// and return where it ends, behind its last quote, or null where libyaml might write the value otherwise.
/// `step` goes over one character other than a blank.
template <typename Step>
const char* SkipQuoted(const char* at, const char* line, Step step) {
  const char quote = *at;
  const char* begin = ++at;
  while (*at != quote) {
    if (*at == ' ') {
      if (at == begin || at[1] == ' ' || at[1] == quote || !IsPlainBlank(at, line)) return nullptr;
      ++at;
    } else if (!step(at)) {
      return nullptr;
    }
  }
  return at == begin ? nullptr : at + 1;
}

/// "\xE9" or "\u20AC", where no shorter escape exists. Steps behind it.
inline bool StepOverEscape(const char*& at) {
  ++at;
  const size_t digits = *at == 'x' ? 2 : *at == 'u' ? 4 : 0;
  ++at;
  uint32_t code = 0;
  for (size_t i = 0; i < digits; ++i, ++at) {
    if (!Is(*at, kHexadecimal)) return false;
    code = code * 16 + static_cast<uint32_t>(*at <= '9' ? *at - '0' : *at - 'A' + 10);
  }
  if (digits == 2) return code > 0xA0;
  const bool is_surrogate = code >= 0xD800 && code <= 0xDFFF;
  return digits == 4 && code > 0xFF && code != 0x2028 && code != 0x2029 && !is_surrogate && code < 0xFFFE;
}

/// libyaml writes these only where a character beyond ASCII makes it, with every such character escaped.
inline const char* SkipDoubleQuoted(const char* begin, const char* line) {
  bool is_needed = false;
  const char* end = SkipQuoted(begin, line, [&](const char*& at) {
    if (*at != '\\') return Is(*at++, kBlock | kColon);
    is_needed = true;
    return StepOverEscape(at);
  });
  return is_needed ? end : nullptr;
}

/// libyaml writes these only where the text would mean something else without quotes.
inline const char* SkipSingleQuoted(const char* begin, const char* line) {
  const char first = begin[1];
  const bool is_alone = first != '\n' && (begin[2] == ' ' || begin[2] == '\'');
  bool is_needed = std::strchr("#,[]{}&*!|>\"%@`", first) != nullptr ||
                   (is_alone && (first == '-' || first == '?' || first == ':'));
  const char* end = SkipQuoted(begin, line, [&](const char*& at) {
    if (*at == ':' && (at[1] == ' ' || at[1] == '\'')) is_needed = true;
    if (*at == '#' && at[-1] == ' ') is_needed = true;
    return Is(*at++, kBlock | kColon);
  });
  return is_needed ? end : nullptr;
}

}  // namespace vexel_yaml::written_style
