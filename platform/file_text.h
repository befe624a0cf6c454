#pragma once

#include <cstddef>
#include <memory>
#include <new>
#include <string_view>

namespace vexel_yaml {

/// The bytes of a large file. Unlike a string's, new bytes are not set to anything before a file is read into
/// them, and the system is asked for large pages: for a scene of 50 MB either takes as long as finding its
/// objects.
class FileText {
 public:
  FileText() = default;
  /// A copy.
  explicit FileText(std::string_view text);

  char* data() { return bytes_.get(); }
  size_t size() const { return size_; }
  std::string_view View() const { return {bytes_.get(), size_}; }

  /// Keeps the bytes that there are; new ones are undefined.
  void resize(size_t size);

 private:
  static constexpr std::align_val_t kAlignment = std::align_val_t(size_t{1} << 21);
  struct Release {
    void operator()(char* bytes) const { ::operator delete[](bytes, kAlignment); }
  };

  std::unique_ptr<char[], Release> bytes_;
  size_t size_ = 0;
  size_t room_ = 0;
};

}  // namespace vexel_yaml
