#include <xxhash.h>

#include <array>
#include <cstdint>
#include <exception>
#include <iostream>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "mapped_file.h"

namespace {

// The run of characters behind the "&" of the document's first line.
std::string_view FileIDOf(std::string_view document) {
  const std::string_view line = document.substr(0, document.find('\n'));
  const size_t mark = line.find('&');
  if (mark == std::string_view::npos) return {};
  const std::string_view rest = line.substr(mark + 1);
  return rest.substr(0, rest.find(' '));
}

std::array<uint8_t, 256> ClassesOfBytes() {
  std::array<uint8_t, 256> classes = {};
  for (const char c : std::string_view(":#\"'{}[]&*!|>%@`\t\r\\")) classes[static_cast<uint8_t>(c)] = 1;
  for (size_t i = 0x80; i < classes.size(); ++i) classes[i] = 2;
  return classes;
}

uint64_t SumOfClasses(std::string_view text) {
  const std::array<uint8_t, 256> classes = ClassesOfBytes();
  uint64_t sum = 0;
  for (const char c : text) sum += classes[static_cast<uint8_t>(c)];
  return sum;
}

using Hashes = std::unordered_map<std::string_view, uint64_t>;

// By file ID.
Hashes HashDocuments(std::string_view text) {
  const std::vector<std::string_view> documents = SplitAtHeaders(text);
  Hashes hashes;
  hashes.reserve(documents.size());
  for (const std::string_view document : documents) {
    hashes.emplace(FileIDOf(document), XXH3_64bits(document.data(), document.size()));
  }
  return hashes;
}

size_t CountEqual(const std::vector<Hashes>& files) {
  size_t count = 0;
  for (const auto& [id, hash] : files[0]) {
    bool is_equal = true;
    for (size_t i = 1; i < files.size() && is_equal; ++i) {
      const auto partner = files[i].find(id);
      is_equal = partner != files[i].end() && partner->second == hash;
    }
    if (is_equal) ++count;
  }
  return count;
}

void Run(const std::vector<std::string>& paths) {
  std::vector<Hashes> files;
  std::string_view first;
  for (size_t i = 1; i < paths.size(); ++i) {
    const std::string_view text = MapFile(paths[i]);
    if (i == 1) first = text;
    files.push_back(HashDocuments(text));
  }
  std::cout << CountEqual(files) << " of " << files[0].size() << " documents are the same in all files, "
            << SumOfClasses(first) << " is the sum of the first file's classes of bytes\n";
  WriteWholeFile(paths[0], first);
}

}  // namespace

/// The least that a merge of whole objects must do: look at every byte of the files once, find out which
/// objects are the same, judge every byte of one file, and write a file of that size.
int main(int argc, char** argv) {
  if (argc < 3) {
    std::cerr << "usage: text_floor <destination> <file>...\n";
    return 2;
  }
  try {
    Run({argv + 1, argv + argc});
  } catch (const std::exception& error) {
    std::cerr << "text_floor: " << error.what() << "\n";
    return 1;
  }
  return 0;
}
