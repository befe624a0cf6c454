#pragma once

#include <set>
#include <string>
#include <string_view>
#include <unordered_map>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// What the engine knows of one class of objects.
struct YAMLTypeInfo {
  using TypeSet = std::set<const YAMLScalar*, ScalarTextLess>;

  const YAMLScalar* persistent_type_id;
  const YAMLScalar* base_persistent_type_id;
  const YAMLScalar* type_name;
  /// Whether one game object may hold several components of the class.
  bool is_multi_instance;
  /// Persistent type IDs of the classes that it requires, and that it can't stand beside.
  TypeSet requires_types;
  TypeSet conflicts_types;

  /// Reads one class entry. Throws std::runtime_error "Cannot read " + key + " in YAMLTypeInfo file".
  static YAMLTypeInfo Read(const YAMLMapping& entry);
};

/// The classes of the engine, by the class IDs that stand in asset files. Filled once, before any diffing;
/// only read afterwards, from any thread.
class YAMLTypeInfoManager {
 public:
  /// Takes the type information over from a file's object "1"; what an earlier file said is forgotten. Of two
  /// entries for one class the first counts. Throws std::runtime_error
  /// "Cannot find MergeTypeInfo object in YAMLMapping provided" and what YAMLTypeInfo::Read throws.
  void Read(const VexelObjects& objects);

  /// The entry of a class, null when it is unknown.
  const YAMLTypeInfo* GetTypeInfo(const YAMLScalar* persistent_type_id) const;

  bool IsEmpty() const { return infos_.empty(); }

 private:
  std::unordered_map<const YAMLScalar*, YAMLTypeInfo> infos_;
};

YAMLTypeInfoManager& GetTypeInfoManager();

/// Reads the type-information file into the registry. Throws YAMLError where the file can't be read, and what
/// YAMLTypeInfoManager::Read throws.
void SetupTypeInfo(const std::string& path);

/// The integers of a compact serialized set: groups of eight hexadecimal digits, each the four bytes of a
/// 32-bit integer, lowest byte first. A trailing partial group is ignored.
/// Throws std::runtime_error "Cannot read compact serialized set '<text>'" where a group holds anything else.
std::set<int32_t> ReadCompactSerializedSet(std::string_view text);

}  // namespace vexel_yaml
