#include "platform/file_text.h"

#include <sys/mman.h>

#include <cstring>

namespace vexel_yaml {

FileText::FileText(std::string_view text) {
  resize(text.size());
  text.copy(data(), text.size());
}

void FileText::resize(size_t size) {
  if (size > room_) {
    std::unique_ptr<char[], Release> bytes(static_cast<char*>(::operator new[](size, kAlignment)));
#ifdef MADV_HUGEPAGE
    // Only what will be filled. Where the system has none, nothing is lost.
    const size_t whole_pages = size - size % static_cast<size_t>(kAlignment);
    if (whole_pages > 0) madvise(bytes.get(), whole_pages, MADV_HUGEPAGE);
#endif
    if (size_ > 0) std::memcpy(bytes.get(), bytes_.get(), size_);
    bytes_ = std::move(bytes);
    room_ = size;
  }
  size_ = size;
}

}  // namespace vexel_yaml
