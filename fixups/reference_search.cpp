#include "fixups/reference_search.h"

#include <cstdint>
#include <cstring>
#include <string>

#include "yaml/folded_object.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kReference = "fileID: ";
// Of its letters the rarest one in scenes: to look for that alone takes less time than memmem does.
constexpr size_t kRareLetter = kReference.find('D');

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
  const std::string_view text = folded->text;
  size_t letter = kRareLetter;
  while ((letter = text.find(kReference[kRareLetter], letter)) != std::string_view::npos) {
    const size_t reference = letter++ - kRareLetter;
    if (text.compare(reference, kReference.size(), kReference) != 0) continue;
    const size_t id = reference + kReference.size();
    size_t id_end = id;
    while (id_end != text.size() && text[id_end] != ',' && text[id_end] != '}' && text[id_end] != '\n')
      ++id_end;
    if (filter_.test(FilterPlace(text.data() + id_end)) && file_ids_.contains(text.substr(id, id_end - id))) {
      return true;
    }
  }
  return false;
}

}  // namespace vexel_yaml
