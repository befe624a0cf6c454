#pragma once

#include <atomic>
#include <deque>
#include <memory>
#include <string_view>
#include <vector>

#include "platform/file_text.h"
#include "platform/mutex.h"
#include "yaml/folded_object.h"
#include "yaml/position_index.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// The texts of files, and what was found out about their documents. Whatever is folded refers to it.
/// Readers on several threads may share one.
class KeptTexts {
 public:
  /// Takes a file's text over.
  std::string_view Keep(FileText text);

  /// A folder of one reader's own for documents behind `header`.
  ObjectFolder& CreateFolder(std::string_view header);

 private:
  Mutex mutex_;
  std::deque<FileText> texts_;
  std::deque<ObjectFolder> folders_;
};

/// What the readers of several versions of one asset find out about the documents of the first of them that
/// is there. In a real merge nearly every document stands in all of them, and is then looked at only once.
class SharedDocuments {
 public:
  /// What one reader found out about a document: the object folded, or, where that can't be, as it was read.
  /// Both null for a document that nobody has seen yet. The objects belong to their readers and must stay
  /// unchanged until all have ended.
  struct Known {
    const FoldedObject* folded = nullptr;
    const YAMLMapping* object = nullptr;
  };

  /// Of documents with one first line only the first few are found.
  explicit SharedDocuments(const std::vector<std::string_view>& documents);

  /// The index of a document with the very same text, `kNone` where there is none. `expected` is looked at
  /// first: the document behind the one that was found last, as versions mostly agree about the order, too.
  uint32_t Find(std::string_view document, size_t expected) const;
  static constexpr uint32_t kNone = PositionIndex::kNone;

  std::string_view GetText(size_t index) const { return entries_[index].text; }
  Known Get(size_t index) const;
  void Publish(size_t index, Known known);

 private:
  struct Entry {
    std::string_view text;
    std::atomic<const FoldedObject*> folded = nullptr;
    std::atomic<const YAMLMapping*> object = nullptr;
  };

  size_t CountWithFirstLine(std::string_view line, uint64_t hash) const;

  std::vector<Entry> entries_;
  // By the first lines, which name the objects: hashing all of the text would cost as much as scanning it.
  PositionIndex index_;
};

/// What the readers of several versions of one asset share while they read.
class DocumentCache {
 public:
  /// `keeps_equal_pairs`: whether a pair that is repeated with an equal value stays, as a repeated key,
  /// rather than being dropped.
  explicit DocumentCache(bool keeps_equal_pairs = false) : keeps_equal_pairs_(keeps_equal_pairs) {}

  bool KeepsEqualPairs() const { return keeps_equal_pairs_; }

  const std::shared_ptr<KeptTexts>& GetTexts() const { return texts_; }

  /// The shared documents, which are those of the first reader that asks, and whose text must be kept. Null
  /// for documents behind another header than its. `is_first` tells the caller whether its own are meant.
  SharedDocuments* Share(std::string_view header, const std::vector<std::string_view>& documents,
                         bool& is_first);

  /// How many readers have asked before this one.
  size_t Enter() { return readers_.fetch_add(1); }

 private:
  const bool keeps_equal_pairs_;
  std::shared_ptr<KeptTexts> texts_ = std::make_shared<KeptTexts>();
  std::atomic<size_t> readers_ = 0;
  Mutex mutex_;
  std::string_view header_;
  std::unique_ptr<SharedDocuments> documents_;
};

}  // namespace vexel_yaml
