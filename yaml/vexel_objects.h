#pragma once

#include <cstdint>
#include <memory>
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

  /// The file IDs of the objects in which some mapping repeats a key with another value, in file order.
  const std::vector<const YAMLScalar*>& GetObjectsWithDuplicateKeys() const {
    return objects_with_duplicate_keys_;
  }
  void AddObjectWithDuplicateKeys(const YAMLScalar* file_id) {
    objects_with_duplicate_keys_.push_back(file_id);
  }

  /// Whether the file's last line had an end. Only known of files that were read with a cache.
  bool EndsInLineBreak() const { return ends_in_line_break_; }
  void SetEndsInLineBreak(bool ends) { ends_in_line_break_ = ends; }

  /// Whether an object's header line must be one that can be read again. Where both sides changed it, a
  /// version for a text merge tool has it blanked.
  enum class Headers : uint8_t { kComplete, kAsTheyAre };

  /// Keeps what folded objects refer to for as long as these objects and their copies live.
  void KeepTexts(std::shared_ptr<const void> texts) { texts_ = std::move(texts); }

  /// Writes the file: the two directives, then a document for each object. Throws what OutputObject throws.
  void Output(std::ostream& out, Headers headers = Headers::kComplete);

  /// The two parts of it, for callers that write objects on several threads.
  void OutputHeader(std::ostream& out) const;
  /// Throws YAMLError for an object that is no mapping, repeats its own keys, has no class ID or file ID
  /// (which `headers` may allow), or holds a value that can't be written. The hint names the object. The
  /// pseudo keys are at its end afterwards.
  static void OutputObject(std::ostream& out, const Slot& slot, Headers headers = Headers::kComplete);

  /// A deep copy of all objects, owned by the caller.
  VexelObjects* Clone() const override;
  /// The same into objects that are there already, and empty.
  void CopyTo(VexelObjects& target) const;

  /// Only for objects that `Clone` or `new` made: none comes from a pool.
  void Free() override { delete this; }

 private:
  std::shared_ptr<const void> texts_;
  std::string tag_prefix_ = "tag:vexel.com,2011:";
  std::vector<SkippedKey> skipped_keys_;
  std::vector<const YAMLScalar*> objects_with_duplicate_keys_;
  bool ends_in_line_break_ = true;
};

}  // namespace vexel_yaml
