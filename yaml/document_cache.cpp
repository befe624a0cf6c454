#include "yaml/document_cache.h"

#include <utility>

namespace vexel_yaml {

std::string_view DocumentCache::Keep(std::string text, size_t& reader) {
  AutoLock lock(mutex_);
  reader = texts_.size();
  return texts_.emplace_back(std::move(text));
}

bool DocumentCache::Serves(std::string_view header) {
  AutoLock lock(mutex_);
  if (!std::exchange(has_header_, true)) header_ = header;
  return header == header_;
}

const YAMLMapping* DocumentCache::Find(std::string_view document) {
  Shard& shard = ShardOf(document);
  AutoLock lock(shard.mutex);
  const auto found = shard.objects.find(document);
  return found == shard.objects.end() ? nullptr : found->second;
}

void DocumentCache::Publish(std::string_view document, const YAMLMapping* object) {
  Shard& shard = ShardOf(document);
  AutoLock lock(shard.mutex);
  shard.objects.emplace(document, object);
}

}  // namespace vexel_yaml
