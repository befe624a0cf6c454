#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "yaml/asset_text.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// One object as it was read.
struct ReadObject {
  const YAMLScalar* file_id = nullptr;
  /// Owned by whoever takes it; with its pseudo keys.
  YAMLMapping* object = nullptr;
  bool holds_duplicate_keys = false;
  /// 1-based lines in the file.
  std::vector<size_t> skipped_key_lines;
};

/// Reads documents of one asset, one at a time, with libyaml.
class DocumentReader {
 public:
  /// `header` stands in front of every document.
  explicit DocumentReader(std::string_view header) : header_(header), chunk_(header) {}

  /// Reads one document. `last`: no other follows in the file. Returns false when libyaml can't start.
  /// Throws std::bad_alloc, and YAMLError, for what libyaml or the limits on hostile input find with the
  /// 1-based line.
  bool Read(const AssetText::Document& document, bool last, ReadObject& result);

 private:
  bool TakeStrippedMark();

  std::string_view header_;
  // What libyaml gets: the header, the document, the start of the next one.
  std::string chunk_;
};

}  // namespace vexel_yaml
