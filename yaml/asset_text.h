#pragma once

#include <string_view>
#include <vector>

#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// The text of one asset file, cut into its documents. Refers to the text, which must outlive it.
class AssetText {
 public:
  /// Throws YAMLError for a text that starts with a UTF-16 byte-order mark and for one that holds anything
  /// but directives and comments where it has no document.
  explicit AssetText(std::string_view text);

  /// The directives: all before the first document.
  std::string_view GetHeader() const { return header_; }

  /// The prefix that "%TAG !v! " gives, empty where there is none.
  std::string_view GetTagPrefix() const;

  /// Each from its "---" line to the next document's.
  const std::vector<std::string_view>& GetDocuments() const { return documents_; }

 private:
  void CheckOnlyDirectives() const;

  std::string_view header_;
  std::vector<std::string_view> documents_;
};

}  // namespace vexel_yaml
