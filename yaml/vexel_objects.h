#pragma once

#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// One asset file in memory: the root mapping from file ID to object, in file order.
///
/// Each object carries, after its own keys, the pseudo keys "MERGE_FileID", "MERGE_ClassID" and, for a
/// stripped one, "MERGE_StrippedPrefab" ("1"), so that the engines treat them like fields.
class VexelObjects final : public YAMLMapping {
 public:
  /// A key that the model can't hold, because it is not a scalar.
  struct SkippedKey {
    const YAMLScalar* file_id;
    /// 1-based line in the file.
    size_t line;
  };

  VexelObjects() : YAMLMapping(false) {}

  YAMLMapping& GetMapping() { return *this; }
  const YAMLMapping& GetMapping() const { return *this; }

  /// The prefix behind "%TAG !v! ", kept so that a file keeps its vendor.
  const std::string& GetTagPrefix() const { return tag_prefix_; }
  void SetTagPrefix(std::string prefix) { tag_prefix_ = std::move(prefix); }

  /// What the reader left out, in file order.
  const std::vector<SkippedKey>& GetSkippedKeys() const { return skipped_keys_; }
  void AddSkippedKey(SkippedKey key) { skipped_keys_.push_back(key); }

  /// Whether any mapping of the file repeats a key with another value, at the root or inside an object.
  bool HoldsDuplicateKeys() const { return holds_duplicate_keys_ || HasDuplicateKeys(); }
  void SetHoldsDuplicateKeys() { holds_duplicate_keys_ = true; }

  /// Writes the file: the two directives, then a document for each object. The pseudo keys are at the end of
  /// each object afterwards. Throws YAMLError when libyaml refuses an object.
  void Output(std::ostream& out);

  /// A deep copy of all objects, owned by the caller.
  VexelObjects* Clone() const override;

  /// Objects of this class never come from a pool.
  void Free() override { delete this; }

 private:
  std::string tag_prefix_ = "tag:vexel.com,2011:";
  std::vector<SkippedKey> skipped_keys_;
  bool holds_duplicate_keys_ = false;
};

}  // namespace vexel_yaml
