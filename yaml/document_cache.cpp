#include "yaml/document_cache.h"

#include <utility>

#include "platform/text_hash.h"

namespace vexel_yaml {

namespace {

// More than a merge reads; a file that repeats one line for ever must not make looking it up slow.
constexpr size_t kMostWithOneLine = 8;

std::string_view FirstLine(std::string_view document) { return document.substr(0, document.find('\n')); }

}  // namespace

std::string_view KeptTexts::Keep(FileText text) {
  AutoLock lock(mutex_);
  return texts_.emplace_back(std::move(text)).View();
}

ObjectFolder& KeptTexts::CreateFolder(std::string_view header) {
  AutoLock lock(mutex_);
  return folders_.emplace_back(header);
}

SharedDocuments::SharedDocuments(const std::vector<std::string_view>& documents)
    : entries_(documents.size()), index_(documents.size()) {
  for (size_t i = 0; i < documents.size(); ++i) {
    entries_[i].text = documents[i];
    const std::string_view line = FirstLine(documents[i]);
    const uint64_t hash = HashText(line);
    if (CountWithFirstLine(line, hash) < kMostWithOneLine) index_.Insert(hash, static_cast<uint32_t>(i));
  }
}

size_t SharedDocuments::CountWithFirstLine(std::string_view line, uint64_t hash) const {
  size_t count = 0;
  index_.Find(hash, [&](uint32_t i) {
    if (FirstLine(entries_[i].text) == line) ++count;
    return count == kMostWithOneLine;
  });
  return count;
}

uint32_t SharedDocuments::Find(std::string_view document, size_t expected) const {
  if (expected < entries_.size() && entries_[expected].text == document) {
    return static_cast<uint32_t>(expected);
  }
  return index_.Find(HashText(FirstLine(document)), [&](uint32_t i) { return entries_[i].text == document; });
}

SharedDocuments::Known SharedDocuments::Get(size_t index) const {
  const Entry& entry = entries_[index];
  return {entry.folded.load(std::memory_order_acquire), entry.object.load(std::memory_order_acquire)};
}

void SharedDocuments::Publish(size_t index, Known known) {
  entries_[index].folded.store(known.folded, std::memory_order_release);
  entries_[index].object.store(known.object, std::memory_order_release);
}

SharedDocuments* DocumentCache::Share(std::string_view header, const std::vector<std::string_view>& documents,
                                      bool& is_first) {
  AutoLock lock(mutex_);
  is_first = documents_ == nullptr;
  if (is_first) {
    header_ = header;
    documents_ = std::make_unique<SharedDocuments>(documents);
  }
  return header == header_ ? documents_.get() : nullptr;
}

}  // namespace vexel_yaml
