#include "yaml/written_object.h"

#include <string>
#include <vector>

#include "yaml/written_style_scanner.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_scalar.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

using written_style::ScalarStyle;

// libyaml folds a line break, with the indent behind it, to one blank.
std::string WithoutBreaks(std::string_view text) {
  std::string line;
  for (size_t begin = 0;;) {
    const size_t end = text.find('\n', begin);
    line += text.substr(begin, end - begin);
    if (end == std::string_view::npos) return line;
    line += ' ';
    begin = text.find_first_not_of(' ', end + 1);
  }
}

void AppendUtf8(std::string& text, uint32_t code) {
  const auto append = [&](uint32_t byte) { text += static_cast<char>(byte); };
  if (code < 0x800) {
    append(0xC0 | code >> 6);
  } else {
    append(0xE0 | code >> 12);
    append(0x80 | (code >> 6 & 0x3F));
  }
  append(0x80 | (code & 0x3F));
}

// Of escapes there are only "\xE9" and "\u20AC".
std::string Unescaped(std::string_view text) {
  std::string result;
  for (size_t at = 0; at < text.size(); ++at) {
    if (text[at] != '\\') {
      result += text[at];
      continue;
    }
    const size_t digits = text[at + 1] == 'x' ? 2 : 4;
    AppendUtf8(result,
               static_cast<uint32_t>(std::stoul(std::string(text.substr(at + 2, digits)), nullptr, 16)));
    at += 1 + digits;
  }
  return result;
}

// Builds what the scanner tells of.
class ObjectBuilder {
 public:
  void NextLine() { ++line_; }

  void Open(bool is_sequence, bool is_flow) {
    YAMLNode* node = is_sequence ? static_cast<YAMLNode*>(YAMLAlloc<YAMLSequence>::create(is_flow))
                                 : YAMLAlloc<YAMLMapping>::create(is_flow);
    // The root begins with its tag.
    node->SetLine(open_.empty() ? kLineOfWrittenObject : line_);
    open_.push_back({node, nullptr, 0, 0});
  }

  void Key(std::string_view key) {
    open_.back().key = YAMLScalar::Lookup(key);
    open_.back().key->SetLine(line_);
  }

  void Scalar(std::string_view text, ScalarStyle style) {
    const YAMLScalar* scalar = style == ScalarStyle::kDoubleQuoted ? YAMLScalar::Lookup(Unescaped(text))
                               : text.find('\n') == std::string_view::npos
                                   ? YAMLScalar::Lookup(text)
                                   : YAMLScalar::Lookup(WithoutBreaks(text));
    scalar->SetLine(line_);
    Add(scalar->AsValue());
  }

  void Close() {
    const Level level = open_.back();
    level.node->SetHash(level.hash);
    if (open_.size() == 1) return;
    open_.pop_back();
    Add(level.node);
  }

  YAMLMapping* GetRoot() const { return open_.front().node->AsMapping(); }

 private:
  // A collection whose end has not come yet, with what its hash and its next pair are made of.
  struct Level {
    YAMLNode* node;
    const YAMLScalar* key;
    uint32_t hash;
    uint32_t position;
  };

  void Add(YAMLNode* value) {
    Level& level = open_.back();
    if (YAMLSequence* sequence = level.node->AsSequence()) {
      sequence->Append(value);
    } else {
      level.node->AsMapping()->Append(level.key, value);
      level.hash = YAMLNode::Combine(level.hash, level.key->GetHash());
    }
    level.hash = YAMLNode::Combine(YAMLNode::Combine(level.hash, value->GetHash()), level.position++);
  }

  std::vector<Level> open_;
  uint32_t line_ = kLineOfWrittenObject;
};

}  // namespace

YAMLMapping* ReadWrittenObject(std::string_view document) {
  WrittenDocument written;
  ObjectBuilder builder;
  if (!written_style::StyleScanner(document, written, builder).Scan()) {
    throw YAMLError("did not find expected <document start>");
  }
  return builder.GetRoot();
}

}  // namespace vexel_yaml
