#include <yaml.h>

#include <algorithm>
#include <array>
#include <exception>
#include <iostream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "mapped_file.h"

namespace {

// What libyaml is given for one document.
struct Source {
  std::array<std::string_view, 3> parts;
  size_t next = 0;
};

int Read(void* data, unsigned char* buffer, size_t size, size_t* read) {
  auto& source = *static_cast<Source*>(data);
  while (source.next + 1 < source.parts.size() && source.parts[source.next].empty()) ++source.next;
  std::string_view& part = source.parts[source.next];
  *read = part.copy(reinterpret_cast<char*>(buffer), size);
  part.remove_prefix(*read);
  return 1;
}

// The directives come first, which libyaml forgets after every document, and the word at the end of some
// headers, which is no YAML, stays away.
Source SourceOf(std::string_view directives, std::string_view document) {
  static constexpr std::string_view kStripped = " stripped";
  const size_t line_end = std::min(document.find('\n'), document.size());
  std::string_view header = document.substr(0, line_end);
  if (header.ends_with(kStripped)) header.remove_suffix(kStripped.size());
  return {{directives, header, document.substr(line_end)}};
}

struct LoadedFile {
  std::string_view text;
  std::vector<yaml_document_t> documents;
  std::string problem;
};

void Load(LoadedFile& file) {
  const std::vector<std::string_view> texts = SplitAtHeaders(file.text);
  const std::string_view directives = file.text.substr(0, file.text.find("---"));
  file.documents.resize(texts.size());
  for (size_t i = 0; i < texts.size(); ++i) {
    Source source = SourceOf(directives, texts[i]);
    yaml_parser_t parser;
    yaml_parser_initialize(&parser);
    yaml_parser_set_input(&parser, Read, &source);
    if (yaml_parser_load(&parser, &file.documents[i]) == 0) {
      file.problem = parser.problem == nullptr ? "no storage" : parser.problem;
    }
    yaml_parser_delete(&parser);
    if (!file.problem.empty()) return;
  }
}

int Append(void* data, unsigned char* buffer, size_t size) {
  static_cast<std::string*>(data)->append(reinterpret_cast<const char*>(buffer), size);
  return 1;
}

std::string Emit(std::vector<yaml_document_t>& documents) {
  std::string text;
  yaml_emitter_t emitter;
  yaml_emitter_initialize(&emitter);
  yaml_emitter_set_output(&emitter, Append, &text);
  for (yaml_document_t& document : documents) {
    if (yaml_emitter_dump(&emitter, &document) == 0) throw std::runtime_error("cannot emit");
  }
  yaml_emitter_close(&emitter);
  yaml_emitter_delete(&emitter);
  return text;
}

void Run(const std::vector<std::string>& paths) {
  std::vector<LoadedFile> files;
  for (size_t i = 1; i < paths.size(); ++i) files.push_back({MapFile(paths[i]), {}, {}});
  std::vector<std::jthread> threads;
  threads.reserve(files.size());
  for (LoadedFile& file : files) threads.emplace_back([&file] { Load(file); });
  for (std::jthread& thread : threads) thread.join();
  for (const LoadedFile& file : files) {
    if (!file.problem.empty()) throw std::runtime_error(file.problem);
  }
  WriteWholeFile(paths[0], Emit(files[0].documents));
}

}  // namespace

/// The least that a merge must do which takes every object apart: libyaml's own trees of all the files, a
/// thread for each, and the first of them written again. What is loaded is left to the end of the process.
int main(int argc, char** argv) {
  if (argc < 3) {
    std::cerr << "usage: libyaml_floor <destination> <file>...\n";
    return 2;
  }
  try {
    Run({argv + 1, argv + argc});
  } catch (const std::exception& error) {
    std::cerr << "libyaml_floor: " << error.what() << "\n";
    return 1;
  }
  return 0;
}
