#include "report/typed_value.h"

#include <algorithm>
#include <charconv>
#include <string_view>

namespace vexel_yaml {

namespace {

using Kind = TypedValue::Kind;

bool IsDigit(char c) { return c >= '0' && c <= '9'; }
bool IsUpper(char c) { return c >= 'A' && c <= 'Z'; }
bool IsLower(char c) { return c >= 'a' && c <= 'z'; }

size_t TakeDigits(std::string_view& text) {
  const size_t count = std::min(text.find_first_not_of("0123456789"), text.size());
  text.remove_prefix(count);
  return count;
}

// Decimal, as the engine writes numbers. Where a zero leads, the text is rather a name or a code.
bool IsNumber(std::string_view text) {
  if (text.starts_with('-')) text.remove_prefix(1);
  if (text.size() > 1 && text[0] == '0' && IsDigit(text[1])) return false;
  const size_t whole = TakeDigits(text);
  size_t fraction = 0;
  if (text.starts_with('.')) {
    text.remove_prefix(1);
    fraction = TakeDigits(text);
  }
  if (whole + fraction == 0) return false;
  if (text.starts_with('e') || text.starts_with('E')) {
    text.remove_prefix(1);
    if (text.starts_with('-') || text.starts_with('+')) text.remove_prefix(1);
    if (TakeDigits(text) == 0) return false;
  }
  return text.empty();
}

const YAMLScalar* ScalarAt(const YAMLMapping& mapping, std::string_view key) {
  const YAMLNode* value = mapping.Get(YAMLScalar::Lookup(key));
  return value == nullptr ? nullptr : value->AsScalar();
}

// Whether the mapping consists of just these numbers.
bool HoldsNumbers(const YAMLMapping& mapping, std::string_view keys) {
  return mapping.Size() == keys.size() && std::ranges::all_of(keys, [&](const char& key) {
           const YAMLScalar* number = ScalarAt(mapping, {&key, 1});
           return number != nullptr && IsNumber(number->GetText());
         });
}

bool TakeColour(const YAMLMapping& mapping, TypedValue& value) {
  constexpr std::string_view kParts = "rgba";
  if (!HoldsNumbers(mapping, kParts)) return false;
  for (size_t i = 0; i < kParts.size(); ++i) {
    const std::string& text = ScalarAt(mapping, kParts.substr(i, 1))->GetText();
    // As it is written: a float is another number once it has more digits.
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value.colour[i]);
    if (error != std::errc()) return false;
  }
  value.kind = Kind::kColour;
  return true;
}

bool TakeVector(const YAMLMapping& mapping, TypedValue& value) {
  for (const std::string_view keys : {"xy", "xyz", "xyzw"}) {
    if (!HoldsNumbers(mapping, keys)) continue;
    for (const char key : keys) {
      value.parts.push_back({std::string(1, key), ScalarAt(mapping, {&key, 1})->GetText()});
    }
    value.kind = Kind::kVector;
    return true;
  }
  return false;
}

void TakeReference(const YAMLMapping& mapping, ObjectNames& names, TypedValue& value) {
  if (!IsReference(&mapping)) return;
  value.kind = Kind::kReference;
  value.id = ScalarAt(mapping, "fileID")->GetText();
  if (const YAMLScalar* guid = ScalarAt(mapping, "guid")) value.guid = guid->GetText();
  if (!value.guid.empty() || LocalReference(&mapping) != nullptr) value.name = names.DescribeTarget(&mapping);
}

bool IsIndex(std::string_view key) {
  if (key.starts_with('+')) key.remove_prefix(1);
  return !key.empty() && std::ranges::all_of(key, IsDigit);
}

// What people call it where others have another name than the field.
std::string Word(std::string_view key) {
  if (key == "m_Father" || key == "m_TransformParent") return "Parent";
  return Readable(key);
}

void AddToLabel(std::string_view key, std::string& label) {
  if (!label.empty()) label += " \u203A ";
  if (IsIndex(key)) {
    label += "Element " + std::string(key.substr(key.starts_with('+') ? 1 : 0));
  } else {
    label += Word(key);
  }
}

}  // namespace

TypedValue TypedValueOf(const YAMLNode* node, ObjectNames& names) {
  TypedValue value;
  if (node == nullptr) return value;
  value.kind = Kind::kText;
  if (const YAMLScalar* scalar = node->AsScalar()) {
    value.is_empty = scalar->GetText().empty();
    if (!IsNumber(scalar->GetText())) return value;
    value.kind = Kind::kNumber;
    value.number = scalar->GetText();
    return value;
  }
  const YAMLMapping* mapping = node->AsMapping();
  if (mapping == nullptr || mapping->GetFolded() != nullptr || mapping->HasDuplicateKeys()) return value;
  if (!TakeColour(*mapping, value) && !TakeVector(*mapping, value)) TakeReference(*mapping, names, value);
  return value;
}

bool IsSwitch(const FieldPath& path) {
  if (path.size() < 3) return false;
  std::string_view name = path.back()->GetText();
  const bool is_engines = name.starts_with("m_");
  if (is_engines) name.remove_prefix(2);
  for (const std::string_view word : {"enabled", "active", "isActive"}) {
    const bool is_word =
        name.size() == word.size() && (name[0] | 0x20) == word[0] && name.substr(1) == word.substr(1);
    if (is_word) return true;
  }
  for (const std::string_view start : {"is", "has", "use"}) {
    const bool begins = name.size() > start.size() && (name[0] | 0x20) == start[0] &&
                        name.substr(1).starts_with(start.substr(1)) && IsUpper(name[start.size()]);
    if (begins) return true;
  }
  return false;
}

std::string Readable(std::string_view key) {
  if (key.starts_with("m_") && key.size() > 2) key.remove_prefix(2);
  std::string text;
  for (size_t i = 0; i < key.size(); ++i) {
    const bool begins_word =
        IsUpper(key[i]) && i > 0 &&
        (IsLower(key[i - 1]) || (IsUpper(key[i - 1]) && i + 1 < key.size() && IsLower(key[i + 1])));
    if (begins_word) text += ' ';
    const bool is_first = text.empty() || text.back() == ' ';
    if (key[i] == '_') {
      text += ' ';
    } else {
      text += is_first && IsLower(key[i]) ? static_cast<char>(key[i] - 'a' + 'A') : key[i];
    }
  }
  return text;
}

std::string FieldLabel(const FieldPath& path) {
  if (path.size() == 1) return "Whole object";
  if (path.back() == YAMLScalar::classIDPlaceHolderName) return "Class ID";
  if (path.back() == YAMLScalar::fileIDPlaceHolderName) return "File ID";
  if (path.back() == YAMLScalar::strippedPrefabPlaceHolderName) return "Stripped mark";
  std::string label;
  for (size_t i = path.size() == 2 ? 1 : 2; i < path.size(); ++i) AddToLabel(path[i]->GetText(), label);
  return label;
}

std::string PropertyLabel(std::string_view property) {
  std::string label;
  while (!property.empty()) {
    const std::string_view key = property.substr(0, property.find('.'));
    AddToLabel(key, label);
    property.remove_prefix(std::min(key.size() + 1, property.size()));
  }
  return label;
}

}  // namespace vexel_yaml
