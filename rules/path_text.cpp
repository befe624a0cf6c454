#include <array>
#include <charconv>
#include <string>
#include <string_view>
#include <unordered_set>

#include "rules/yaml_sequence_remapper.h"

namespace vexel_yaml {

namespace {

struct NamedEscape {
  char letter;
  char character;
};

constexpr std::array<NamedEscape, 8> kNamedEscapes = {{{'a', '\a'},
                                                       {'b', '\b'},
                                                       {'t', '\t'},
                                                       {'n', '\n'},
                                                       {'v', '\v'},
                                                       {'f', '\f'},
                                                       {'r', '\r'},
                                                       {'\\', '\\'}}};

// An escape that stands for nothing: a pattern may end with it, so that it is no other key as it stands.
constexpr std::string_view kNothing = "\\&";

void AppendHex(char character, std::string& text) {
  constexpr std::string_view kDigits = "0123456789abcdef";
  const auto byte = static_cast<unsigned char>(character);
  text += "\\x";
  text += kDigits[byte >> 4];
  text += kDigits[byte & 15];
}

void AppendEscaped(char character, std::string& text) {
  for (const NamedEscape& escape : kNamedEscapes) {
    if (character != escape.character) continue;
    text += '\\';
    text += escape.letter;
    return;
  }
  AppendHex(character, text);
}

// How many bytes at the start of `text` are a control character, a line break or a mark that turns the
// direction of what follows: those of ASCII, and in UTF-8 the controls from U+0080, U+2028 to U+202E and
// U+2066 to U+2069.
size_t ControlLength(std::string_view text) {
  const auto byte = [&](size_t i) {
    return i < text.size() ? static_cast<unsigned char>(text[i]) : static_cast<unsigned char>(0);
  };
  if (byte(0) < 0x20 || byte(0) == 0x7F) return 1;
  if (byte(0) == 0xC2 && byte(1) >= 0x80 && byte(1) <= 0x9F) return 2;
  if (byte(0) != 0xE2) return 0;
  const bool separates_or_turns = byte(1) == 0x80 && byte(2) >= 0xA8 && byte(2) <= 0xAE;
  const bool isolates = byte(1) == 0x81 && byte(2) >= 0xA6 && byte(2) <= 0xA9;
  return separates_or_turns || isolates ? 3 : 0;
}

// A key may hold a line break, and one that reads like a line of a record file: in a path it must neither
// begin a line, nor move a terminal's cursor, nor turn the rest of the line around.
void AppendOnOneLine(std::string_view component, std::string& text) {
  while (!component.empty()) {
    const size_t controls = ControlLength(component);
    for (const char character : component.substr(0, controls)) AppendEscaped(character, text);
    if (controls == 0) text += component.front();
    component.remove_prefix(controls == 0 ? 1 : controls);
  }
}

// `component` with escapes for what has a meaning in a line of choices: a dot, a blank, the "*" of any
// component, escapes, the text of a header.
std::string ComponentPattern(std::string_view component) {
  std::string pattern;
  if (component == "*") {
    AppendHex('*', pattern);
    return pattern;
  }
  while (!component.empty()) {
    const char first = component.front();
    const bool ends_header = first == ':' && pattern.ends_with("onflicts");
    const bool has_meaning = first == '.' || first == ' ' || first == '\\' || ends_header;
    const size_t escaped = has_meaning ? 1 : ControlLength(component);
    for (const char character : component.substr(0, escaped)) {
      // Not "\n" and its like, which are somebody's key more often than "\x0a" is.
      if (character == '\\') pattern += "\\\\";
      if (character != '\\') AppendHex(character, pattern);
    }
    if (escaped == 0) pattern += first;
    component.remove_prefix(escaped == 0 ? 1 : escaped);
  }
  return pattern;
}

// Takes an escape off the start of `text`, which begins with a backslash; false where it is none.
bool TakeEscape(std::string_view& text, std::string& resolved) {
  if (text.size() < 2) return false;
  if (text.starts_with(kNothing)) {
    text.remove_prefix(kNothing.size());
    return true;
  }
  for (const NamedEscape& escape : kNamedEscapes) {
    if (text[1] != escape.letter) continue;
    resolved += escape.character;
    text.remove_prefix(2);
    return true;
  }
  constexpr size_t kHexLength = 4;  // \x1b
  if (text[1] != 'x' || text.size() < kHexLength) return false;
  unsigned char byte = 0;
  const char* const end = text.data() + kHexLength;
  if (std::from_chars(text.data() + 2, end, byte, 16).ptr != end) return false;
  resolved += static_cast<char>(byte);
  text.remove_prefix(kHexLength);
  return true;
}

}  // namespace

std::string PathToString(const FieldPath& path) {
  std::string text;
  for (size_t i = 0; i < path.size(); ++i) {
    if (i > 0) text += '.';
    AppendOnOneLine(path[i]->GetText(), text);
  }
  return text;
}

std::string PathPattern(const FieldPath& path, const std::unordered_set<const YAMLScalar*>& others) {
  std::string text;
  for (size_t i = 0; i < path.size(); ++i) {
    if (i > 0) text += '.';
    std::string pattern = ComponentPattern(path[i]->GetText());
    while (pattern != path[i]->GetText() && others.contains(YAMLScalar::Lookup(pattern))) pattern += kNothing;
    text += pattern;
  }
  return text;
}

const YAMLScalar* ResolveEscapes(const YAMLScalar* component) {
  std::string_view text = component->GetText();
  if (text.find('\\') == std::string_view::npos) return component;
  std::string resolved;
  while (!text.empty()) {
    if (text.front() == '\\' && TakeEscape(text, resolved)) continue;
    resolved += text.front();
    text.remove_prefix(1);
  }
  return YAMLScalar::Lookup(resolved);
}

}  // namespace vexel_yaml
