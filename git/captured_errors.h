#pragma once

#include <iostream>
#include <sstream>
#include <string>

namespace vexel_yaml {

/// What is written to standard error in its lifetime, for messages that go elsewhere or name temporary files.
class CapturedErrors {
 public:
  CapturedErrors() : previous_(std::cerr.rdbuf(text_.rdbuf())) {}
  CapturedErrors(const CapturedErrors&) = delete;
  CapturedErrors& operator=(const CapturedErrors&) = delete;
  ~CapturedErrors() { std::cerr.rdbuf(previous_); }

  std::string Text() const { return text_.str(); }

 private:
  std::ostringstream text_;
  std::streambuf* previous_;
};

}  // namespace vexel_yaml
