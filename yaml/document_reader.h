#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "yaml/document_limits.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// One object as it was read.
struct ReadObject {
  const YAMLScalar* file_id = nullptr;
  /// Owned by whoever takes it; with its pseudo keys.
  YAMLMapping* object = nullptr;
  /// Whether it used up some of the file's limits, so that its next reader has to count it, too.
  bool counts_for_limits = false;
  bool holds_duplicate_keys = false;
  /// 1-based lines in the file.
  std::vector<size_t> skipped_key_lines;
};

/// Reads documents of one asset, one at a time, with libyaml.
class DocumentReader {
 public:
  /// The directives of `header` stand in front of every document. Lines are counted from `first_line`, where
  /// the file begins. `keeps_equal_pairs` is for the converter.
  /// Throws YAMLError "YAML directives are longer than 1024 bytes".
  DocumentReader(std::string_view header, const char* first_line, bool keeps_equal_pairs);

  /// Reads one document of the file. `last`: no other follows in it. Returns false when libyaml can't start.
  /// Throws std::bad_alloc, and YAMLError with the 1-based line and the object in its hint.
  bool Read(std::string_view document, bool last, ReadObject& result);

 private:
  bool TakeStrippedMark();
  std::string_view FirstLine() const;
  size_t LineOf(std::string_view document);
  bool ReadChunk(bool last, bool stripped, ReadObject& result, size_t& problem_line);

  // Up to where the file's lines have been counted, for the few documents that anyone asks for.
  const char* file_begin_;
  const char* counted_to_;
  size_t counted_lines_ = 0;
  const bool keeps_equal_pairs_;
  std::string directives_;
  // Of the header: how many there are in the directives, and how many were left out.
  size_t kept_lines_ = 0;
  size_t dropped_lines_ = 0;
  DocumentLimits limits_;
  // What libyaml gets: the directives, the document, the start of the next one.
  std::string chunk_;
};

}  // namespace vexel_yaml
