#include "report/override_names.h"

#include <vector>

#include "fixups/engine_keys.h"
#include "report/value_text.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// The components of a path: file ID, class, m_Modification, m_Modifications, index, field.
constexpr size_t kListLength = 4;
constexpr size_t kFieldAt = 5;

const YAMLScalar* Key(std::string_view text) { return YAMLScalar::Lookup(text); }

const YAMLNode* Field(const YAMLMapping* mapping, const YAMLScalar* key) {
  return mapping == nullptr || mapping->HasDuplicateKeys() ? nullptr : mapping->Get(key);
}

std::string TextAt(const YAMLMapping* mapping, std::string_view key) {
  const YAMLNode* value = Field(mapping, Key(key));
  return value == nullptr || value->AsScalar() == nullptr ? std::string() : value->AsScalar()->GetText();
}

std::string NameOf(const YAMLMapping* entry) {
  const std::string property = TextAt(entry, "propertyPath");
  const YAMLNode* target = Field(entry, Key("target"));
  if (property.empty() || target == nullptr) return {};
  return OnOneLine(property + " of " + TextAt(target->AsMapping(), "fileID"));
}

const YAMLSequence* ListIn(const VexelObjects& version, const FieldPath& path) {
  const YAMLNode* node = &version;
  for (size_t i = 0; i < kListLength && node != nullptr; ++i) node = Field(node->AsMapping(), path[i]);
  return node == nullptr ? nullptr : node->AsSequence();
}

// The value at the record's place in an entry.
const YAMLNode* PlaceIn(const YAMLMapping* entry, const FieldPath& path) {
  const YAMLNode* node = entry;
  for (size_t i = kFieldAt; i < path.size() && node != nullptr; ++i) node = Field(node->AsMapping(), path[i]);
  return node;
}

const YAMLNode* NewValue(const Operation* operation) {
  if (operation == nullptr) return nullptr;
  const auto kind = operation->GetKind();
  if (kind != Operation::Kind::kAdd && kind != Operation::Kind::kChange) return nullptr;
  return static_cast<const ValuedOperation*>(operation)->GetValue();
}

// The entries that hold what the operation has put at the place.
std::vector<const YAMLMapping*> EntriesWith(const VexelObjects& version, const FieldPath& path,
                                            const Operation* operation) {
  std::vector<const YAMLMapping*> entries;
  const YAMLSequence* list = ListIn(version, path);
  const YAMLNode* value = NewValue(operation);
  if (list == nullptr || value == nullptr) return entries;
  for (const YAMLNode* item : list->GetItems()) {
    const YAMLMapping* entry = item == nullptr ? nullptr : item->AsMapping();
    const YAMLNode* there = entry == nullptr ? nullptr : PlaceIn(entry, path);
    if (there != nullptr && there->EqualsExpensive(value)) entries.push_back(entry);
  }
  return entries;
}

const YAMLNode* BaseValue(const VexelObjects& base, const FieldPath& path, const std::string& name) {
  const YAMLSequence* list = ListIn(base, path);
  if (list == nullptr) return nullptr;
  for (const YAMLNode* item : list->GetItems()) {
    const YAMLMapping* entry = item == nullptr ? nullptr : item->AsMapping();
    if (NameOf(entry) == name) return PlaceIn(entry, path);
  }
  return nullptr;
}

// The override whose place in the list is known.
std::optional<NamedOverride> OverrideIn(const VexelObjects& version, const FieldPath& path) {
  const YAMLSequence* list = ListIn(version, path);
  const auto index = static_cast<size_t>(path[kListLength]->GetIntValue());
  if (list == nullptr || index >= list->Size() || list->GetItems()[index] == nullptr) return std::nullopt;
  const YAMLMapping* entry = list->GetItems()[index]->AsMapping();
  const std::string name = NameOf(entry);
  if (name.empty()) return std::nullopt;
  return NamedOverride{name, PlaceIn(entry, path)};
}

bool IsInOverride(const FieldPath& path) {
  return path.size() >= kFieldAt && path[kListLength - 1] == Key("m_Modifications");
}

}  // namespace

std::optional<NamedOverride> OverrideAt(const RecordingConflictResolver::Record& record,
                                        const ComparedVersions& versions) {
  const FieldPath& path = record.path;
  if (!IsInOverride(path)) return std::nullopt;
  if (versions.are_scenes) {
    const bool is_new = path[kListLength]->GetText().starts_with('+');
    std::optional<NamedOverride> found = OverrideIn(is_new ? versions.left : versions.base, path);
    if (found && is_new) found->base_value = nullptr;
    return found;
  }
  std::optional<std::string> name;
  for (const YAMLMapping* theirs : EntriesWith(versions.left, path, record.left)) {
    for (const YAMLMapping* ours : EntriesWith(versions.right, path, record.right)) {
      const std::string common = NameOf(theirs);
      if (common.empty() || common != NameOf(ours) || name == common) continue;
      // Several fit.
      if (name) return std::nullopt;
      name = common;
    }
  }
  if (!name) return std::nullopt;
  return NamedOverride{*name, BaseValue(versions.base, path, *name)};
}

}  // namespace vexel_yaml
