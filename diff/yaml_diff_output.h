#pragma once

#include <ostream>
#include <string>
#include <string_view>

namespace vexel_yaml {

/// Writes text that people read, with the current indentation in front of every line, also of an empty one.
class YAMLDiffOutput {
 public:
  /// `out` is not owned; a level indents by `indent_width` blanks.
  YAMLDiffOutput(std::ostream& out, size_t indent_width) : out_(out), indent_unit_(indent_width, ' ') {}

  YAMLDiffOutput& operator<<(std::string_view text);
  YAMLDiffOutput& operator<<(int number) { return *this << std::string_view(std::to_string(number)); }
  YAMLDiffOutput& operator<<(size_t number) { return *this << std::string_view(std::to_string(number)); }
  YAMLDiffOutput& operator<<(YAMLDiffOutput& (*manipulator)(YAMLDiffOutput&)) { return manipulator(*this); }

  void PushLevel() { indent_ += indent_unit_; }
  void PopLevel();

  /// Characters written on the current line so far, without the indentation.
  size_t GetColumn() const { return column_; }

  /// Replaces the indentation and returns the old one.
  std::string ExchangeIndent(std::string indent);
  const std::string& GetIndent() const { return indent_; }

 private:
  std::ostream& out_;
  std::string indent_unit_;
  std::string indent_;
  size_t column_ = 0;
};

/// Ends the line.
YAMLDiffOutput& endl(YAMLDiffOutput& out);

}  // namespace vexel_yaml
