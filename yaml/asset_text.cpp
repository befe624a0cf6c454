#include "yaml/asset_text.h"

#include <algorithm>
#include <cstdint>
#include <string>

#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

void CheckEncoding(std::string_view text) {
  const std::string_view mark = text.substr(0, 2);
  if (mark != "\xFF\xFE" && mark != "\xFE\xFF") return;
  throw YAMLError("YAML file is not UTF-8 encoded, all files must be UTF-8 encoded for performance reasons");
}

constexpr std::string_view kMark = "\n---";

// Where a line begins with "---", npos for nowhere. Scenes are mostly made of short lines, each of which the
// string's own search looks at; so a piece is gone through at once first, by instructions that compare many
// bytes.
size_t FindMark(std::string_view text, size_t start) {
  constexpr size_t kPiece = 256;
  while (start + kPiece + kMark.size() < text.size()) {
    const char* piece = text.data() + start;
    uint8_t found = 0;
    for (size_t i = 0; i < kPiece; ++i) {
      found |= static_cast<uint8_t>((piece[i] == '\n') & (piece[i + 1] == '-') & (piece[i + 2] == '-'));
    }
    if (found != 0) {
      const size_t at = text.substr(start, kPiece + kMark.size() - 1).find(kMark);
      if (at != std::string_view::npos) return start + at;
    }
    start += kPiece;
  }
  return text.find(kMark, start);
}

// Where libyaml would end the document: at a "---" that starts a line and stands alone or before a blank,
// also inside a text.
size_t FindDocumentEnd(std::string_view text, size_t start) {
  for (;;) {
    const size_t found = FindMark(text, start);
    if (found == std::string_view::npos) return text.size();
    start = found + kMark.size();
    if (start == text.size() || std::string_view(" \t\r\n").find(text[start]) != std::string_view::npos) {
      return found + 1;
    }
  }
}

}  // namespace

AssetText::AssetText(std::string_view text) : header_(text.substr(0, text.find("---"))) {
  CheckEncoding(text);
  if (text.size() <= header_.size() + 5) {
    CheckOnlyDirectives();
    return;
  }
  for (size_t start = header_.size(); start < text.size();) {
    const size_t end = FindDocumentEnd(text, start);
    documents_.push_back(text.substr(start, end - start));
    start = end;
  }
}

// A file without objects is fine, but text that belongs to no object must not vanish.
void AssetText::CheckOnlyDirectives() const {
  size_t line = 1;
  for (size_t begin = 0; begin < header_.size(); ++line) {
    const size_t end = std::min(header_.find('\n', begin), header_.size());
    const std::string_view content = header_.substr(begin, end - begin);
    const size_t first = content.find_first_not_of(line == 1 ? " \t\r\xEF\xBB\xBF" : " \t\r");
    if (first != std::string_view::npos && content[first] != '%' && content[first] != '#') {
      throw YAMLError("did not find expected <document start>", "see line " + std::to_string(line));
    }
    begin = end + 1;
  }
}

std::string_view AssetText::GetTagPrefix() const {
  constexpr std::string_view kDirective = "%TAG !v! ";
  const size_t found = header_.find(kDirective);
  if (found == std::string_view::npos) return {};
  const std::string_view prefix = header_.substr(found + kDirective.size());
  return prefix.substr(0, prefix.find_first_of(" \t\r\n"));
}

}  // namespace vexel_yaml
