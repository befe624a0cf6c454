// Feeds a fuzz target without libFuzzer: replay MUTATIONS FOLDERS... runs it on every file of the folders
// (one that is missing counts as empty) and on so many mutations of them, the same ones each time. Where the
// target ends the process, the input stays in the current folder, in a file named after the program.
#include <algorithm>
#include <csignal>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <random>
#include <string>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size);

namespace {

constexpr size_t kLargestMutation = 16384;

std::vector<std::string> ReadFiles(const std::filesystem::path& folder) {
  std::vector<std::filesystem::path> paths;
  if (std::filesystem::exists(folder)) {
    for (const auto& entry : std::filesystem::directory_iterator(folder)) paths.push_back(entry.path());
  }
  std::ranges::sort(paths);
  std::vector<std::string> texts;
  for (const auto& path : paths) {
    std::ifstream file(path, std::ios::binary);
    texts.emplace_back(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
  }
  return texts;
}

class Mutator {
 public:
  explicit Mutator(const std::vector<std::string>& texts) : texts_(texts) {}

  std::string Next() {
    std::string text = texts_[Below(texts_.size())];
    for (size_t i = 1 + Below(4); i > 0; --i) MutateOnce(text);
    return text.substr(0, kLargestMutation);
  }

 private:
  // Not std::uniform_int_distribution, which may give other numbers in another library.
  size_t Below(size_t limit) { return random_() % limit; }

  std::string Piece(const std::string& text) {
    return text.empty() ? "" : text.substr(Below(text.size()), 1 + Below(64));
  }

  std::string LineOf(const std::string& text) {
    const size_t begin = AfterLine(text, Below(text.size() + 1));
    return text.substr(begin, AfterLine(text, begin) - begin);
  }

  static size_t AfterLine(const std::string& text, size_t at) {
    const size_t end = text.find('\n', at);
    return end == std::string::npos ? text.size() : end + 1;
  }

  void MutateOnce(std::string& text) {
    static constexpr const char* kTokens[] = {"---", " &1", "\n",     "  ",   "- ",       ": ",  "{",  "}",
                                              "[",   "]",   "*a",     "&a",   "!v!",      "#",   "'",  "\"",
                                              "\\",  "\r",  "\x1b",   "\xff", "? ",       "|\n", "..", "*",
                                              "_",   "-1",  "fileID", "left", "99999999", "%"};
    const size_t at = Below(text.size() + 1);
    const std::string& other = texts_[Below(texts_.size())];
    switch (Below(7)) {
      case 0:
        if (at < text.size()) text[at] = static_cast<char>(Below(256));
        return;
      case 1:
        text.insert(at, kTokens[Below(std::size(kTokens))]);
        return;
      case 2:
        text.erase(at, 1 + Below(16));
        return;
      case 3:
        text.insert(at, Piece(other));
        return;
      case 4:
        text.insert(AfterLine(text, at), LineOf(other));
        return;
      case 5:
        text.erase(AfterLine(text, at), LineOf(text).size());
        return;
      default:
        text.resize(at);
    }
  }

  const std::vector<std::string>& texts_;
  std::mt19937 random_;
};

const std::string* running = nullptr;
std::string copy;

// What is left to do where the target found a fault: the input is wanted.
void KeepInput(int signal) {
  std::ofstream(copy, std::ios::binary) << *running;
  std::signal(signal, SIG_DFL);
  std::raise(signal);
}

void Run(const std::string& text) {
  running = &text;
  LLVMFuzzerTestOneInput(reinterpret_cast<const uint8_t*>(text.data()), text.size());
}

}  // namespace

int main(int argc, char** argv) {
  std::vector<std::string> texts;
  for (int i = 2; i < argc; ++i) {
    for (std::string& text : ReadFiles(argv[i])) texts.push_back(std::move(text));
  }
  if (texts.empty()) {
    std::cerr << "usage: " << argv[0] << " MUTATIONS FOLDERS...; the folders must hold files\n";
    return 1;
  }
  copy = std::filesystem::path(argv[0]).filename().string() + ".input";
  for (const int signal : {SIGABRT, SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGTERM}) std::signal(signal, KeepInput);
  for (const std::string& text : texts) Run(text);
  Mutator mutator(texts);
  const int mutations = std::atoi(argv[1]);
  for (int i = 0; i < mutations; ++i) Run(mutator.Next());
  std::cout << texts.size() << " files and " << mutations << " mutations\n";
}
