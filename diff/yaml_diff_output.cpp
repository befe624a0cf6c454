#include "diff/yaml_diff_output.h"

#include <utility>

namespace vexel_yaml {

YAMLDiffOutput& YAMLDiffOutput::operator<<(std::string_view text) {
  while (!text.empty()) {
    const size_t line_end = text.find('\n');
    const std::string_view line = text.substr(0, line_end);
    if (column_ == 0) out_ << indent_;
    out_ << line;
    column_ += line.size();
    if (line_end == std::string_view::npos) break;
    out_ << '\n';
    column_ = 0;
    text.remove_prefix(line_end + 1);
  }
  return *this;
}

void YAMLDiffOutput::PopLevel() {
  indent_.resize(indent_.size() < indent_unit_.size() ? 0 : indent_.size() - indent_unit_.size());
}

std::string YAMLDiffOutput::ExchangeIndent(std::string indent) {
  return std::exchange(indent_, std::move(indent));
}

YAMLDiffOutput& endl(YAMLDiffOutput& out) { return out << std::string_view("\n"); }

}  // namespace vexel_yaml
