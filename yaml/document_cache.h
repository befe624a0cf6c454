#pragma once

#include <array>
#include <deque>
#include <string>
#include <string_view>
#include <unordered_map>

#include "platform/mutex.h"
#include "platform/text_hash.h"
#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Lets the readers of several versions of one asset parse a document that stands in all of them only once:
/// in a real merge nearly every object does. Readers on several threads may share one. The objects published
/// belong to their readers and must stay unchanged while the cache is in use.
class DocumentCache {
 public:
  /// Takes a file's text over, so that documents can be looked up by it. The reader's number, counting from
  /// 0, tells readers apart.
  std::string_view Keep(std::string text, size_t& reader);

  /// Whether the cache serves documents behind this header: it is the first reader's.
  bool Serves(std::string_view header);

  /// The object that was read from this very text, null if none was yet.
  const YAMLMapping* Find(std::string_view document);

  /// `document` must lie in a text that the cache keeps. Gives the object the number of its text.
  void Publish(std::string_view document, YAMLMapping* object);

 private:
  struct Shard {
    Mutex mutex;
    std::unordered_map<std::string_view, const YAMLMapping*, TextHash> objects;
  };

  Shard& ShardOf(std::string_view document) { return shards_[HashText(document) % shards_.size()]; }

  Mutex mutex_;
  std::deque<std::string> texts_;
  bool has_header_ = false;
  std::string header_;
  std::array<Shard, 64> shards_;
};

}  // namespace vexel_yaml
