#include "yaml/document_cache.h"

#include <atomic>
#include <cstdint>
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

void DocumentCache::Publish(std::string_view document, YAMLMapping* object) {
  // Objects of two caches may be compared, too.
  static std::atomic<uint32_t> last_number = 0;
  Shard& shard = ShardOf(document);
  AutoLock lock(shard.mutex);
  const auto [published, is_first] = shard.objects.emplace(document, object);
  object->SetTextNumber(is_first ? ++last_number : published->second->GetTextNumber());
}

}  // namespace vexel_yaml
