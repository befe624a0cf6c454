#pragma once

#include <array>
#include <cstdint>
#include <streambuf>

namespace vexel_yaml {

/// A stream's buffer that writes to a descriptor, which it doesn't own, and remembers why a write failed:
/// the library's own file streams forget the reason, and lose that of the last piece altogether.
class DescriptorBuffer : public std::streambuf {
 public:
  explicit DescriptorBuffer(int descriptor);

  /// The errno of the first write that failed, else 0. After a failure nothing more is written.
  int GetErrorNumber() const { return error_number_; }

  /// How many bytes have reached the descriptor.
  uint64_t GetCount() const { return count_; }

 protected:
  int_type overflow(int_type character) override;
  int sync() override;
  std::streamsize xsputn(const char* text, std::streamsize size) override;

 private:
  bool Flush();
  bool Write(const char* text, size_t size);

  int descriptor_;
  int error_number_ = 0;
  uint64_t count_ = 0;
  std::array<char, 65536> buffer_;
};

}  // namespace vexel_yaml
