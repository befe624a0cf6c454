#include "yaml/write_written_style.h"

#include <algorithm>

#include "yaml/written_scalars.h"
#include "yaml/yaml_mapping.h"
#include "yaml/yaml_scalar.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

using namespace written_style;

// Every "Write" returns whether what it was given is known. Those of block collections begin where the first
// entry stands: behind a dash that is not the start of the line.
class StyleWriter {
 public:
  explicit StyleWriter(std::string& text) : text_(text) {}

  bool WriteBlockMapping(const YAMLMapping& mapping, size_t column) {
    if (mapping.HasDuplicateKeys()) return false;
    bool is_first = true;
    for (const auto& [key, value] : mapping) {
      if (!is_first) BreakLine(column);
      is_first = false;
      if (!WriteKey(*key) || !WriteFieldValue(*value, column)) return false;
    }
    return true;
  }

 private:
  size_t Column() const { return text_.size() - line_; }
  bool IsBeyondBestWidth() const { return Column() > size_t{kBestWidth}; }

  void BreakLine(size_t column) {
    text_ += '\n';
    line_ = text_.size();
    text_.append(column, ' ');
  }

  // What stands behind the colon of a key in `column`. The dashes of a list stand below the key.
  bool WriteFieldValue(const YAMLNode& value, size_t column) {
    if (IsBlock(value)) {
      const size_t block_column = value.AsSequence() == nullptr ? column + 2 : column;
      BreakLine(block_column);
      return WriteBlock(value, block_column);
    }
    return WriteOnLine(value, column + 2);
  }

  bool WriteBlockSequence(const YAMLSequence& sequence, size_t column) {
    bool is_first = true;
    for (const YAMLNode* item : sequence.GetItems()) {
      if (item == nullptr) continue;
      if (!is_first) BreakLine(column);
      is_first = false;
      text_ += '-';
      if (!WriteItem(*item, column + 2)) return false;
    }
    return true;
  }

  bool WriteItem(const YAMLNode& item, size_t column) {
    if (!IsBlock(item)) return WriteOnLine(item, column);
    text_ += ' ';
    return WriteBlock(item, column);
  }

  // libyaml has no other way to write an empty collection than in brackets.
  static bool IsBlock(const YAMLNode& node) {
    if (const YAMLSequence* sequence = node.AsSequence()) {
      return !sequence->IsFlow() &&
             std::ranges::any_of(sequence->GetItems(), [](const YAMLNode* item) { return item != nullptr; });
    }
    const YAMLMapping* mapping = node.AsMapping();
    return mapping != nullptr && !mapping->IsFlow() && (mapping->HasDuplicateKeys() || mapping->Size() > 0);
  }

  bool WriteBlock(const YAMLNode& node, size_t column) {
    const YAMLSequence* sequence = node.AsSequence();
    return sequence == nullptr ? WriteBlockMapping(*node.AsMapping(), column)
                               : WriteBlockSequence(*sequence, column);
  }

  // With a blank before it. `indent`: of the lines that follow, where one is not enough.
  bool WriteOnLine(const YAMLNode& node, size_t indent) {
    const YAMLScalar* scalar = node.AsScalar();
    if (scalar == YAMLScalar::empty) return true;
    text_ += ' ';
    return scalar == nullptr ? WriteFlow(node, indent) : WritePlain(*scalar, indent, SkipPlainWord);
  }

  bool WriteFlow(const YAMLNode& node, size_t indent) {
    const YAMLSequence* sequence = node.AsSequence();
    return sequence == nullptr ? WriteFlowMapping(*node.AsMapping(), indent)
                               : WriteFlowSequence(*sequence, indent);
  }

  bool WriteFlowMapping(const YAMLMapping& mapping, size_t indent) {
    if (mapping.HasDuplicateKeys()) return false;
    char before = '{';
    for (const auto& [key, value] : mapping) {
      BeginFlowEntry(before, indent);
      before = ',';
      if (!WriteKey(*key)) return false;
      text_ += ' ';
      if (!WriteFlowValue(*value, indent + 2)) return false;
    }
    text_ += before == '{' ? "{}" : "}";
    return true;
  }

  bool WriteFlowSequence(const YAMLSequence& sequence, size_t indent) {
    char before = '[';
    for (const YAMLNode* item : sequence.GetItems()) {
      if (item == nullptr) continue;
      BeginFlowEntry(before, indent);
      before = ',';
      if (!WriteFlowValue(*item, indent + 2)) return false;
    }
    text_ += before == '[' ? "[]" : "]";
    return true;
  }

  void BeginFlowEntry(char before, size_t indent) {
    text_ += before;
    if (IsBeyondBestWidth()) {
      BreakLine(indent);
    } else if (before == ',') {
      text_ += ' ';
    }
  }

  bool WriteFlowValue(const YAMLNode& value, size_t indent) {
    const YAMLScalar* scalar = value.AsScalar();
    if (scalar == nullptr) return WriteFlow(value, indent);
    return WritePlain(*scalar, indent, [](const char* at) {
      while (Is(*at, kFlow)) ++at;
      return at;
    });
  }

  bool WriteKey(const YAMLScalar& key) {
    const std::string& text = key.GetText();
    const char* at = text.c_str();
    if (!StepOverKey(at) || at != text.data() + text.size()) return false;
    text_ += text;
    text_ += ':';
    return true;
  }

  // `skip_word` leads to the end, to a blank, or to what would need quotes.
  template <typename SkipWord>
  bool WritePlain(const YAMLScalar& scalar, size_t indent, SkipWord skip_word) {
    scalar.CheckWritable();
    const char* word = scalar.GetText().c_str();
    const char* end = word + scalar.GetText().size();
    const char* at = word;
    if (!StepOverPlainStart(at)) return false;
    for (;;) {
      at = skip_word(at);
      text_.append(word, at);
      if (at == end) return true;
      if (!IsInsidePlain(at)) return false;
      if (IsBeyondBestWidth()) {
        BreakLine(indent);
      } else {
        text_ += ' ';
      }
      word = ++at;
    }
  }

  std::string& text_;
  // Where the last line starts.
  size_t line_ = 0;
};

}  // namespace

bool WriteInWrittenStyle(const YAMLNode& node, std::string& text) {
  const YAMLMapping* mapping = node.AsMapping();
  if (mapping == nullptr || mapping->IsFlow() || mapping->HasDuplicateKeys() || mapping->Size() == 0)
    return false;
  return StyleWriter(text).WriteBlockMapping(*mapping, 0);
}

}  // namespace vexel_yaml
