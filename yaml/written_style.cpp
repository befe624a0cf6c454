#include "yaml/written_style.h"

#include "yaml/written_style_scanner.h"

namespace vexel_yaml {

namespace {

struct NobodyListens {
  void NextLine() {}
  void Open(bool /*is_sequence*/, bool /*is_flow*/) {}
  void Key(std::string_view /*key*/) {}
  void Scalar(std::string_view /*text*/, written_style::ScalarStyle /*style*/) {}
  void Close() {}
};

}  // namespace

bool IsInWrittenStyle(std::string_view document, WrittenDocument& result) {
  if (!document.ends_with('\n') || document.size() > (size_t{1} << 26)) return false;
  NobodyListens sink;
  return written_style::StyleScanner(document, result, sink).Scan();
}

bool IsWrittenHeader(std::string_view header) {
  constexpr std::string_view kDirectives = "%YAML 1.1\n%TAG !v! ";
  if (!header.starts_with(kDirectives) || !header.ends_with('\n')) return false;
  const std::string_view prefix = header.substr(kDirectives.size(), header.size() - kDirectives.size() - 1);
  return prefix.size() > 1 && prefix.starts_with("tag:") &&
         prefix.find_first_not_of("abcdefghijklmnopqrstuvwxyz0123456789.,:-") == std::string_view::npos;
}

}  // namespace vexel_yaml
