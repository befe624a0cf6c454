#include "platform/descriptor_buffer.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>

namespace vexel_yaml {

DescriptorBuffer::DescriptorBuffer(int descriptor) : descriptor_(descriptor) {
  setp(buffer_.data(), buffer_.data() + buffer_.size());
}

DescriptorBuffer::int_type DescriptorBuffer::overflow(int_type character) {
  if (!Flush()) return traits_type::eof();
  if (!traits_type::eq_int_type(character, traits_type::eof())) {
    *pptr() = traits_type::to_char_type(character);
    pbump(1);
  }
  return traits_type::not_eof(character);
}

int DescriptorBuffer::sync() { return Flush() ? 0 : -1; }

std::streamsize DescriptorBuffer::xsputn(const char* text, std::streamsize size) {
  if (size > epptr() - pptr()) {
    if (!Flush()) return 0;
    // A long text needs no second copy.
    if (static_cast<size_t>(size) >= buffer_.size()) return Write(text, static_cast<size_t>(size)) ? size : 0;
  }
  std::copy_n(text, size, pptr());
  pbump(static_cast<int>(size));
  return size;
}

bool DescriptorBuffer::Flush() {
  const auto size = static_cast<size_t>(pptr() - pbase());
  setp(buffer_.data(), buffer_.data() + buffer_.size());
  return Write(buffer_.data(), size);
}

bool DescriptorBuffer::Write(const char* text, size_t size) {
  while (size > 0 && error_number_ == 0) {
    const ssize_t written = write(descriptor_, text, size);
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) {
      // A device that takes nothing and gives no reason would be tried for ever.
      error_number_ = written < 0 ? errno : EIO;
      break;
    }
    text += written;
    size -= static_cast<size_t>(written);
    count_ += static_cast<uint64_t>(written);
  }
  return error_number_ == 0;
}

}  // namespace vexel_yaml
