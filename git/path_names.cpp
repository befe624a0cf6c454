#include "git/path_names.h"

#include <sha1.h>

#include <array>
#include <cstdint>

namespace vexel_yaml {

namespace {

// What git writes as a letter behind a backslash, and the letters.
constexpr std::string_view kSpecial = "\a\b\t\n\v\f\r\"\\";
constexpr std::string_view kLetters = "abtnvfr\"\\";

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
  std::array<char, SHA1_DIGEST_STRING_LENGTH> name;
  return SHA1Data(reinterpret_cast<const uint8_t*>(text.data()), text.size(), name.data());
}

}  // namespace vexel_yaml
