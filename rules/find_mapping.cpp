#include <utility>

#include "rules/element_keys.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

namespace {

const YAMLScalar* FindScalar(const YAMLNode* node, const FieldPath& path) {
  const YAMLNode* found = YAMLSequenceRemapper::GetYAMLNodeFieldByPath(node, path);
  return found == nullptr ? nullptr : found->AsScalar();
}

}  // namespace

ElementKeyReader::ElementKeyReader(const std::vector<FieldPath>& key_paths) : key_paths_(key_paths) {
  if (key_paths.empty() || key_paths[0].empty() || key_paths[0].back() != YAMLScalar::fileID) return;
  guid_path_ = key_paths[0];
  guid_path_.back() = YAMLScalar::guid;
}

const YAMLScalar* ElementKeyReader::Read(const YAMLNode* element) const {
  auto values = YAMLSequenceRemapper::GetUniqueMappingValues(key_paths_, element);
  if (values.empty()) return nullptr;
  const YAMLScalar* guid = guid_path_.empty() ? nullptr : FindScalar(element, guid_path_);
  if (guid != nullptr) values.push_back(guid);
  return YAMLSequenceRemapper::CollapseKeyElementValues(values);
}

const YAMLNode* YAMLSequenceRemapper::GetYAMLNodeFieldByPath(const YAMLNode* node, const FieldPath& path) {
  for (const YAMLScalar* component : path) {
    if (component == YAMLScalar::underscore) continue;
    const YAMLMapping* mapping = node == nullptr ? nullptr : node->AsMapping();
    // A mapping that repeats keys can't be asked for one, but it must not end the diff that meets it.
    if (mapping == nullptr || mapping->HasDuplicateKeys()) return nullptr;
    if (component != YAMLScalar::star) {
      node = mapping->Get(component);
    } else {
      node = mapping->Size() == 0 ? nullptr : mapping->First();
    }
  }
  return node;
}

std::vector<const YAMLScalar*> YAMLSequenceRemapper::GetUniqueMappingValues(
    const std::vector<FieldPath>& key_paths, const YAMLNode* node) {
  std::vector<const YAMLScalar*> values;
  values.reserve(key_paths.size());
  for (const FieldPath& path : key_paths) {
    const YAMLScalar* value = FindScalar(node, path);
    if (value == nullptr) return {};
    values.push_back(value);
  }
  return values;
}

const YAMLScalar* YAMLSequenceRemapper::CollapseKeyElementValues(
    const std::vector<const YAMLScalar*>& values) {
  // Most keys are a single value, of which there may be one for every object of a scene.
  if (values.size() == 1) return values[0];
  std::string text;
  for (size_t i = 0; i < values.size(); ++i) {
    if (i > 0) text += ':';
    text += values[i]->GetText();
  }
  return YAMLScalar::Lookup(text);
}

bool YAMLSequenceRemapper::FindUniqueIndexes(const std::vector<FieldPath>& key_paths,
                                             const YAMLSequence& sequence, KeyIndexes& indexes) {
  const ElementKeyReader reader(key_paths);
  indexes.reserve(sequence.Size());
  for (const YAMLNode* element : sequence.GetItems()) {
    const YAMLScalar* key = reader.Read(element);
    const auto index = static_cast<uint32_t>(indexes.size());
    if (key == nullptr || !indexes.emplace(key, index).second) return false;
  }
  return true;
}

YAMLSequenceRemapper* YAMLSequenceRemapper::FindMapping(const FieldPath& path, const YAMLSequence& base,
                                                        const YAMLSequence& changed) {
  const std::vector<FieldPath>& key_paths = ChooseKeyPaths(path);
  if (key_paths.empty()) return FindGenericMapping(path, base, changed);

  KeyIndexes base_indexes;
  KeyIndexes changed_indexes;
  if (!FindUniqueIndexes(key_paths, base, base_indexes) ||
      !FindUniqueIndexes(key_paths, changed, changed_indexes)) {
    return FindGenericMapping(path, base, changed);
  }

  YAMLSequenceRemapper found(static_cast<uint32_t>(base.Size()), static_cast<uint32_t>(changed.Size()));
  found.is_set_ = true;
  for (const auto& [key, index] : base_indexes) {
    const auto partner = changed_indexes.find(key);
    if (partner != changed_indexes.end()) found.mapping_[index] = partner->second;
  }
  return IntoPoolUnlessIdentity(std::move(found));
}

YAMLSequenceRemapper* YAMLSequenceRemapper::FindIdMapping(const std::vector<FieldPath>& key_paths,
                                                          const YAMLSequence& source,
                                                          const YAMLSequence& target, bool keep_identity) {
  const ElementKeyReader reader(key_paths);
  KeyIndexes target_indexes;
  target_indexes.reserve(target.Size());
  for (size_t i = 0; i < target.Size(); ++i) {
    const YAMLScalar* key = reader.Read(target.GetItems()[i]);
    if (key != nullptr) target_indexes.emplace(key, static_cast<uint32_t>(i));
  }

  YAMLSequenceRemapper found(static_cast<uint32_t>(source.Size()), static_cast<uint32_t>(target.Size()));
  found.is_set_ = true;
  for (size_t i = 0; i < source.Size(); ++i) {
    const auto partner = target_indexes.find(reader.Read(source.GetItems()[i]));
    if (partner != target_indexes.end()) found.mapping_[i] = partner->second;
  }
  if (keep_identity) return YAMLAlloc<YAMLSequenceRemapper>::create(std::move(found));
  return IntoPoolUnlessIdentity(std::move(found));
}

}  // namespace vexel_yaml
