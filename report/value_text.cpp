#include "report/value_text.h"

#include <algorithm>
#include <map>
#include <set>
#include <sstream>

#include "diff/yaml_diff_output.h"

namespace vexel_yaml {

namespace {

constexpr size_t kMostOfOperation = 60;
constexpr std::string_view kEmptyText = "(empty)";

bool IsContinuation(char byte) { return (static_cast<unsigned char>(byte) & 0xC0) == 0x80; }

bool IsControl(std::string_view character) {
  const auto byte = static_cast<unsigned char>(character.front());
  if (byte < 0x80) return byte < 0x20 || byte == 0x7F;
  // U+0080 to U+009F are control characters, too.
  if (byte == 0xC2) return static_cast<unsigned char>(character[1]) < 0xA0;
  // What cannot be seen, breaks lines or turns the direction of what follows lets a text look like another
  // one. Joiners (U+200C, U+200D) are no such thing: scripts and emoji need them.
  const auto within = [&](std::string_view first, std::string_view last) {
    return character >= first && character <= last;
  };
  return character == "\u200B" || within("\u200E", "\u200F") || within("\u2028", "\u202E") ||
         within("\u2066", "\u2069") || character == "\uFEFF";
}

// The number of bytes of the UTF-8 character that `text` starts with, 0 where it starts with none.
size_t CharacterLength(std::string_view text) {
  const auto first = static_cast<unsigned char>(text.front());
  if (first < 0x80) return 1;
  const size_t length = first < 0xC2 ? 0 : first < 0xE0 ? 2 : first < 0xF0 ? 3 : first < 0xF5 ? 4 : 0;
  if (length == 0 || text.size() < length) return 0;
  for (size_t i = 1; i < length; ++i) {
    if (!IsContinuation(text[i])) return 0;
  }
  const auto second = static_cast<unsigned char>(text[1]);
  const bool overlong = (first == 0xE0 && second < 0xA0) || (first == 0xF0 && second < 0x90);
  const bool surrogate = first == 0xED && second >= 0xA0;
  const bool too_large = first == 0xF4 && second >= 0x90;
  return overlong || surrogate || too_large ? 0 : length;
}

template <typename Control>
std::string Decoded(std::string_view text, Control on_control) {
  std::string result;
  result.reserve(text.size());
  while (!text.empty()) {
    const size_t length = CharacterLength(text);
    const std::string_view character = text.substr(0, std::max<size_t>(length, 1));
    text.remove_prefix(character.size());
    if (length == 0) {
      result += "\uFFFD";
    } else if (IsControl(character)) {
      on_control(character, result);
    } else {
      result += character;
    }
  }
  return result;
}

// Writes a value until there is enough of it.
class ValueWriter {
 public:
  ValueWriter(ObjectNames& names, size_t most) : names_(names), most_(most) {}

  void Write(const YAMLNode* value) {
    if (value == nullptr || text_.size() > most_) return;
    if (const YAMLScalar* scalar = value->AsScalar()) {
      text_ += scalar == YAMLScalar::empty ? "\"\"" : scalar->GetText();
    } else if (const YAMLSequence* sequence = value->AsSequence()) {
      WriteSequence(*sequence);
    } else {
      WriteMapping(*value->AsMapping());
    }
  }

  const std::string& GetText() const { return text_; }

 private:
  void WriteSequence(const YAMLSequence& sequence) {
    text_ += '[';
    std::string_view separator;
    for (const YAMLNode* item : sequence.GetItems()) {
      if (item == nullptr) continue;
      text_ += separator;
      Write(item);
      separator = ", ";
      if (text_.size() > most_) return;
    }
    text_ += ']';
  }

  void WriteMapping(const YAMLMapping& mapping) {
    text_ += '{';
    std::string_view separator;
    const auto write = [&](const YAMLMapping::Slot& slot) {
      if (text_.size() > most_ || slot.key->IsPseudoKey()) return;
      text_ += separator;
      text_ += slot.key->GetText();
      text_ += ": ";
      Write(slot.value);
      separator = ", ";
    };
    if (mapping.HasDuplicateKeys()) {
      for (const YAMLMapping::Slot& slot : mapping.GetDuplicatePairs()) write(slot);
    } else {
      for (const YAMLMapping::Slot& slot : mapping) write(slot);
    }
    text_ += '}';
    const YAMLScalar* target = LocalReference(&mapping);
    const std::string name = target == nullptr ? std::string() : names_.Describe(target);
    if (!name.empty()) text_ += " " + name;
  }

  ObjectNames& names_;
  size_t most_;
  std::string text_;
};

std::string Joined(const std::vector<std::string>& texts, std::string_view separator) {
  std::string joined;
  for (const std::string& text : texts) joined.append(joined.empty() ? "" : separator).append(text);
  return joined;
}

// Writes a value as people know it.
class NamedWriter {
 public:
  NamedWriter(ObjectNames& names, bool has_ids) : names_(names), has_ids_(has_ids) {}

  std::string Text(const YAMLNode* value) {
    if (value == nullptr) return {};
    if (const YAMLScalar* scalar = value->AsScalar()) {
      return scalar == YAMLScalar::empty ? std::string(kEmptyText) : scalar->GetText();
    }
    if (const YAMLSequence* list = value->AsSequence()) return '[' + Joined(Elements(*list), ", ") + ']';
    std::string name = TargetText(value, has_ids_);
    return name.empty() ? MappingText(*value->AsMapping()) : name;
  }

  std::vector<std::string> Elements(const YAMLSequence& list) {
    const std::set<std::string> shared = SharedNames(list);
    std::vector<std::string> elements;
    for (const YAMLNode* item : list.GetItems()) {
      const YAMLNode* reference = ReferenceIn(item);
      const bool has_id = has_ids_ || shared.contains(names_.DescribeTarget(reference));
      const std::string name = TargetText(reference, has_id);
      elements.push_back(OnOneLine(name.empty() ? Text(item) : name));
    }
    return elements;
  }

 private:
  // The names that several things have to which the list refers.
  std::set<std::string> SharedNames(const YAMLSequence& list) {
    std::set<std::string> shared;
    std::map<std::string, const YAMLNode*> references;
    for (const YAMLNode* item : list.GetItems()) {
      const YAMLNode* reference = ReferenceIn(item);
      if (reference == nullptr) continue;
      const std::string name = names_.DescribeTarget(reference);
      const YAMLNode* first = references.emplace(name, reference).first->second;
      if (!first->HasSameContent(*reference)) shared.insert(name);
    }
    return shared;
  }

  std::string TargetText(const YAMLNode* reference, bool has_id) {
    std::string name = names_.DescribeTarget(reference);
    if (name.empty() || !has_id) return name;
    const YAMLMapping& parts = *reference->AsMapping();
    name += " (" + parts.Get(YAMLScalar::fileID)->AsScalar()->GetText();
    if (const YAMLNode* guid = parts.Get(YAMLScalar::guid)) name += " in " + guid->AsScalar()->GetText();
    return name + ")";
  }

  std::string MappingText(const YAMLMapping& mapping) {
    std::string text;
    const auto add = [&](const YAMLMapping::Slot& slot) {
      if (slot.key->IsPseudoKey()) return;
      text += (text.empty() ? "" : ", ") + slot.key->GetText() + ": " + Text(slot.value);
    };
    if (mapping.HasDuplicateKeys()) {
      for (const YAMLMapping::Slot& slot : mapping.GetDuplicatePairs()) add(slot);
    } else {
      for (const YAMLMapping::Slot& slot : mapping) add(slot);
    }
    return '{' + text + '}';
  }

  ObjectNames& names_;
  const bool has_ids_;
};

}  // namespace

std::string Shortened(std::string_view text, size_t most) {
  if (text.size() <= most) return std::string(text);
  size_t end = most - kEllipsis.size();
  while (end > 0 && IsContinuation(text[end])) --end;
  return std::string(text.substr(0, end)) + std::string(kEllipsis);
}

std::string OnOneLine(std::string_view text) {
  std::string line = Decoded(text, [](std::string_view, std::string& result) { result += ' '; });
  const auto repeated = [](char a, char b) { return a == ' ' && b == ' '; };
  line.erase(std::unique(line.begin(), line.end(), repeated), line.end());
  if (line.starts_with(' ')) line.erase(0, 1);
  if (line.ends_with(' ')) line.pop_back();
  return line;
}

std::string Cleaned(std::string_view text) {
  return Decoded(text, [](std::string_view character, std::string& result) {
    if (character == "\t" || character == "\n") {
      result += character;
    } else if (character != "\r") {
      result += "\uFFFD";
    }
  });
}

std::string ValueText(const YAMLNode* value, ObjectNames& names, size_t most) {
  ValueWriter writer(names, most);
  writer.Write(value);
  return Shortened(writer.GetText(), most);
}

std::string NamedText(const YAMLNode* value, ObjectNames& names, NamedWith with) {
  const YAMLSequence* list = value == nullptr ? nullptr : value->AsSequence();
  if (list != nullptr && list->Size() > 0) return Joined(NamedElements(*list, names, with), "\n");
  return NamedWriter(names, with == NamedWith::kFileIDs).Text(value);
}

std::vector<std::string> NamedElements(const YAMLSequence& list, ObjectNames& names, NamedWith with) {
  return NamedWriter(names, with == NamedWith::kFileIDs).Elements(list);
}

std::string OperationText(const Operation& operation) {
  std::ostringstream text;
  YAMLDiffOutput out(text, 1);
  operation.Output(out);
  return Shortened(OnOneLine(text.view()), kMostOfOperation);
}

}  // namespace vexel_yaml
