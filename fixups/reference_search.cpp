#include "fixups/reference_search.h"

#include <cstdint>
#include <cstring>
#include <string>

#include "yaml/folded_object.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kReference = "fileID: ";

}  // namespace

ReferenceSearch::ReferenceSearch(const std::vector<const YAMLScalar*>& file_ids) {
  for (const YAMLScalar* file_id : file_ids) {
    file_ids_.insert(file_id->GetText());
    const std::string reference = std::string(kReference) + file_id->GetText();
    filter_.set(FilterPlace(reference.data() + reference.size()));
  }
}

size_t ReferenceSearch::FilterPlace(const char* end) {
  uint64_t bytes;
  static_assert(kReference.size() >= sizeof(bytes));
  std::memcpy(&bytes, end - sizeof(bytes), sizeof(bytes));
  return bytes * 0x9E3779B97F4A7C15U >> 48U;
}

bool ReferenceSearch::MayRefer(const YAMLNode& object) const {
  const FoldedObject* folded = GetFolded(&object);
  if (folded == nullptr) return true;
  const char* const end = folded->text.data() + folded->text.size();
  const char* at = folded->text.data();
  while (true) {
    // Faster than string_view's: this goes through whole scenes.
    at = static_cast<const char*>(
        memmem(at, static_cast<size_t>(end - at), kReference.data(), kReference.size()));
    if (at == nullptr) return false;
    at += kReference.size();
    const char* id_end = at;
    while (id_end != end && *id_end != ',' && *id_end != '}' && *id_end != '\n') ++id_end;
    if (filter_.test(FilterPlace(id_end)) && file_ids_.contains({at, static_cast<size_t>(id_end - at)})) {
      return true;
    }
  }
}

}  // namespace vexel_yaml
