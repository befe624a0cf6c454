#include "yaml/asset_text.h"
#include "yaml/document_cache.h"
#include "yaml/document_reader.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

// Reads the documents of one file into slots, in any order.
class FileReader {
 public:
  explicit FileReader(std::string_view text) : text_(text), objects_(text_.GetDocuments().size()) {}

  const AssetText& GetText() const { return text_; }

  bool ReadAll() {
    DocumentReader documents(text_.GetHeader());
    for (size_t i = 0; i < objects_.size(); ++i) {
      if (!Read(documents, i)) return false;
    }
    return true;
  }

  // Each reader starts at a place of its own, so that each parses a part of what they have in common and
  // finds the rest parsed.
  bool ReadAllSharing(DocumentCache& cache, size_t reader) {
    DocumentReader documents(text_.GetHeader());
    const size_t count = objects_.size();
    for (size_t i = 0; i < count; ++i) {
      if (!ReadSharing(documents, (i + count * (reader % 3) / 3) % count, cache)) return false;
    }
    return true;
  }

  void MoveInto(VexelObjects& objects) {
    for (const ReadObject& read : objects_) {
      objects.Append(read.file_id, read.object);
      if (read.holds_duplicate_keys) objects.AddObjectWithDuplicateKeys(read.file_id);
      for (const size_t line : read.skipped_key_lines) objects.AddSkippedKey({read.file_id, line});
    }
    if (!text_.GetTagPrefix().empty()) objects.SetTagPrefix(std::string(text_.GetTagPrefix()));
    objects.RebuildHash(true);
  }

 private:
  bool Read(DocumentReader& documents, size_t index) {
    return documents.Read(text_.GetDocuments()[index], index + 1 == objects_.size(), objects_[index]);
  }

  bool ReadSharing(DocumentReader& documents, size_t index, DocumentCache& cache) {
    const std::string_view document = text_.GetDocuments()[index].text;
    ReadObject& read = objects_[index];
    if (const YAMLMapping* shared = cache.Find(document)) {
      read.object = shared->Clone();
      read.file_id = shared->Get(YAMLScalar::fileIDPlaceHolderName)->AsScalar();
      return true;
    }
    if (!Read(documents, index)) return false;
    // What a copy can't stand for is read by everyone.
    if (!read.holds_duplicate_keys && read.skipped_key_lines.empty() && !read.counts_for_limits)
      cache.Publish(document, read.object);
    return true;
  }

  AssetText text_;
  std::vector<ReadObject> objects_;
};

}  // namespace

bool ParseYAMLString(std::string text, VexelObjects& objects, DocumentCache* cache) {
  if (cache == nullptr) {
    FileReader file(text);
    if (!file.ReadAll()) return false;
    file.MoveInto(objects);
    return true;
  }
  size_t reader = 0;
  FileReader file(cache->Keep(std::move(text), reader));
  if (!cache->Serves(file.GetText().GetHeader())) {
    if (!file.ReadAll()) return false;
  } else {
    try {
      if (!file.ReadAllSharing(*cache, reader)) return false;
    } catch (const YAMLError&) {
      // In its own order, so that of several errors the first is reported.
      file.ReadAll();
      throw;
    }
  }
  file.MoveInto(objects);
  return true;
}

}  // namespace vexel_yaml
