#include "yaml/type_info.h"

#include <charconv>
#include <stdexcept>
#include <utility>

#include "yaml/read_yaml.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

const YAMLScalar* ReadScalar(const YAMLMapping& entry, const YAMLScalar* key) {
  const YAMLNode* value = entry.Get(key);
  const YAMLScalar* scalar = value == nullptr ? nullptr : value->AsScalar();
  if (scalar == nullptr) throw std::runtime_error("Cannot read " + key->GetText() + " in YAMLTypeInfo file");
  return scalar;
}

YAMLTypeInfo::TypeSet ReadTypes(const YAMLMapping& entry, const YAMLScalar* key) {
  YAMLTypeInfo::TypeSet types;
  for (const int32_t id : ReadCompactSerializedSet(ReadScalar(entry, key)->GetText())) {
    types.insert(YAMLScalar::Lookup(std::to_string(id)));
  }
  return types;
}

}  // namespace

std::set<int32_t> ReadCompactSerializedSet(std::string_view text) {
  std::set<int32_t> integers;
  for (std::string_view rest = text; rest.size() >= 8; rest.remove_prefix(8)) {
    uint32_t value = 0;
    for (size_t byte = 0; byte < 4; ++byte) {
      uint32_t bits = 0;
      const char* digits = rest.data() + 2 * byte;
      const auto [end, error] = std::from_chars(digits, digits + 2, bits, 16);
      if (error != std::errc() || end != digits + 2) {
        throw std::runtime_error("Cannot read compact serialized set '" + std::string(text) + "'");
      }
      value |= bits << (8 * byte);
    }
    integers.insert(static_cast<int32_t>(value));
  }
  return integers;
}

YAMLTypeInfo YAMLTypeInfo::Read(const YAMLMapping& entry) {
  YAMLTypeInfo info;
  info.persistent_type_id = ReadScalar(entry, YAMLScalar::mergeTypeInfoPersistentTypeID);
  info.type_name = ReadScalar(entry, YAMLScalar::mergeTypeInfoTypeName);
  info.is_multi_instance = ReadScalar(entry, YAMLScalar::mergeTypeInfoIsMultiInstance)->GetIntValue() == 1;
  info.base_persistent_type_id = ReadScalar(entry, YAMLScalar::mergeTypeInfoBasePersistentTypeID);
  info.requires_types = ReadTypes(entry, YAMLScalar::mergeTypeInfoRequires);
  info.conflicts_types = ReadTypes(entry, YAMLScalar::mergeTypeInfoConflicts);
  return info;
}

void YAMLTypeInfoManager::Read(const VexelObjects& objects) {
  infos_.clear();
  const YAMLNode* object = objects.Get(YAMLScalar::one);
  const YAMLMapping* mapping = object == nullptr ? nullptr : object->AsMapping();
  const YAMLNode* list = mapping == nullptr ? nullptr : mapping->Get(YAMLScalar::mergeTypeInfo);
  const YAMLSequence* entries = list == nullptr ? nullptr : list->AsSequence();
  if (entries == nullptr) {
    throw std::runtime_error("Cannot find " + YAMLScalar::mergeTypeInfo->GetText() +
                             " object in YAMLMapping provided");
  }
  for (const YAMLNode* item : entries->GetItems()) {
    if (item->AsMapping() == nullptr)
      throw std::runtime_error("An entry of the YAMLTypeInfo file is not a mapping");
    YAMLTypeInfo info = YAMLTypeInfo::Read(*item->AsMapping());
    infos_.emplace(info.persistent_type_id, std::move(info));
  }
}

const YAMLTypeInfo* YAMLTypeInfoManager::GetTypeInfo(const YAMLScalar* persistent_type_id) const {
  const auto found = infos_.find(persistent_type_id);
  return found == infos_.end() ? nullptr : &found->second;
}

YAMLTypeInfoManager& GetTypeInfoManager() {
  static YAMLTypeInfoManager manager;
  return manager;
}

void SetupTypeInfo(const std::string& path) {
  VexelObjects objects;
  ReadYAMLPath(path, objects);
  ReportSkippedKeys(path, objects);
  GetTypeInfoManager().Read(objects);
}

}  // namespace vexel_yaml
