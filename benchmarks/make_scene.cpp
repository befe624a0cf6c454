#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iostream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "scene_documents.h"

namespace {

constexpr uint64_t kMaxObjects = 100'000'000;

struct Options {
  uint64_t objects = 30'000;
  double edited_percent = 1;
  uint64_t seed = 1;
  std::vector<std::string> paths;
};

constexpr std::string_view kUsage =
    "usage: make_scene [--objects N] [--edited PERCENT] [--seed S] <base> <left> <right>\n"
    "  Writes a scene of N objects (30000) and two edited versions of it, in each of which about\n"
    "  PERCENT (1, at most 50) per cent of the objects are changed, added or removed. With 100, both of\n"
    "  them change every object, in fields of their own.\n";

uint64_t ParseCount(const std::string& option, const std::string& text, uint64_t lowest, uint64_t highest) {
  char* end = nullptr;
  errno = 0;
  const unsigned long long value = std::strtoull(text.c_str(), &end, 10);
  const bool is_number = !text.empty() && text.find_first_not_of("0123456789") == std::string::npos;
  if (!is_number || errno != 0 || value < lowest || value > highest) {
    throw std::invalid_argument(option + " takes a whole number from " + std::to_string(lowest) + " to " +
                                std::to_string(highest) + ", not '" + text + "'");
  }
  return value;
}

double ParsePercent(const std::string& text) {
  char* end = nullptr;
  const double value = std::strtod(text.c_str(), &end);
  if (text.empty() || *end != '\0' || !((value >= 0 && value <= 50) || value == 100)) {
    throw std::invalid_argument("--edited takes a percentage from 0 to 50, or 100, not '" + text + "'");
  }
  return value;
}

Options ParseOptions(const std::vector<std::string>& arguments) {
  Options options;
  for (size_t i = 0; i < arguments.size(); ++i) {
    const std::string& argument = arguments[i];
    if (!argument.starts_with("--")) {
      options.paths.push_back(argument);
      continue;
    }
    if (argument != "--objects" && argument != "--edited" && argument != "--seed") {
      throw std::invalid_argument("unknown option '" + argument + "'");
    }
    if (++i == arguments.size()) throw std::invalid_argument(argument + " needs a value");
    if (argument == "--objects") options.objects = ParseCount(argument, arguments[i], 1, kMaxObjects);
    if (argument == "--edited") options.edited_percent = ParsePercent(arguments[i]);
    if (argument == "--seed") options.seed = ParseCount(argument, arguments[i], 0, UINT64_MAX);
  }
  if (options.paths.size() != 3) {
    throw std::invalid_argument("three paths are needed, " + std::to_string(options.paths.size()) + " given");
  }
  return options;
}

/// One of the three files, written in pieces so that a scene of any size needs little memory.
class SceneFile {
 public:
  explicit SceneFile(const std::string& path) : path_(path), stream_(path, std::ios::binary) {
    if (!stream_) Fail("cannot open");
    pending_ = "%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n";
  }

  std::string& text() { return pending_; }

  void WriteIfLarge() {
    if (pending_.size() > kPieceSize) Write();
  }

  void Close() {
    Write();
    stream_.close();
    if (!stream_) Fail("cannot write");
  }

 private:
  static constexpr size_t kPieceSize = 1 << 20;

  void Write() {
    stream_.write(pending_.data(), static_cast<std::streamsize>(pending_.size()));
    if (!stream_) Fail("cannot write");
    pending_.clear();
  }

  [[noreturn]] void Fail(const char* what) const {
    throw std::runtime_error(std::string(what) + " '" + path_ + "': " + std::strerror(errno));
  }

  std::string path_;
  std::ofstream stream_;
  std::string pending_;
};

void WriteScenes(const Options& options) {
  const SceneDocuments documents(options.objects, options.edited_percent / 100, options.seed);
  SceneFile base(options.paths[0]);
  SceneFile left(options.paths[1]);
  SceneFile right(options.paths[2]);

  for (uint64_t group = 0; group < documents.group_count(); ++group) {
    documents.AppendGroup(group, Version::kBase, base.text());
    documents.AppendGroup(group, Version::kLeft, left.text());
    documents.AppendGroup(group, Version::kRight, right.text());
    base.WriteIfLarge();
    left.WriteIfLarge();
    right.WriteIfLarge();
  }
  documents.AppendTail(Version::kBase, base.text());
  documents.AppendTail(Version::kLeft, left.text());
  documents.AppendTail(Version::kRight, right.text());
  base.Close();
  left.Close();
  right.Close();
}

}  // namespace

int main(int argc, char** argv) {
  try {
    WriteScenes(ParseOptions({argv + 1, argv + argc}));
  } catch (const std::invalid_argument& error) {
    std::cerr << "make_scene: " << error.what() << "\n" << kUsage;
    return 2;
  } catch (const std::exception& error) {
    std::cerr << "make_scene: " << error.what() << "\n";
    return 1;
  }
  return 0;
}
