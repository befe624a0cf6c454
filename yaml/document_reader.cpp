#include "yaml/document_reader.h"

#include <yaml.h>

#include <algorithm>
#include <new>
#include <span>
#include <utility>

#include "yaml/convert_document.h"
#include "yaml/pseudo_keys.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

std::string_view LeadingNumber(std::string_view text) {
  return text.substr(0, std::min(text.find_first_not_of("0123456789-"), text.size()));
}

// The number behind the line's first "&".
std::string_view FileIDIn(std::string_view first_line) {
  const size_t anchor = first_line.find('&');
  return anchor == std::string_view::npos ? std::string_view() : LeadingNumber(first_line.substr(anchor + 1));
}

// Loads one document; holds libyaml's objects over exceptions.
class LoadedDocument {
 public:
  LoadedDocument() = default;
  LoadedDocument(const LoadedDocument&) = delete;
  LoadedDocument& operator=(const LoadedDocument&) = delete;
  ~LoadedDocument() {
    if (loaded_) yaml_document_delete(&document_);
    if (parser_started_) yaml_parser_delete(&parser_);
  }

  // False when libyaml can't start.
  bool Load(std::string_view chunk) {
    if (yaml_parser_initialize(&parser_) == 0) return false;
    parser_started_ = true;
    chunk_ = chunk;
    yaml_parser_set_input_string(&parser_, reinterpret_cast<const unsigned char*>(chunk.data()),
                                 chunk.size());
    loaded_ = yaml_parser_load(&parser_, &document_) != 0;
    if (!loaded_) Fail();
    return true;
  }

  // What follows must be what the caller takes for the end: otherwise some of the text would be lost.
  void CheckEnd(bool last) {
    yaml_event_t event;
    if (yaml_parser_parse(&parser_, &event) == 0) Fail();
    const yaml_event_type_t type = event.type;
    yaml_event_delete(&event);
    if (type == (last ? YAML_STREAM_END_EVENT : YAML_DOCUMENT_START_EVENT)) return;
    throw YAMLError("did not find expected <document start>");
  }

  yaml_document_t& Get() { return document_; }
  yaml_node_t* GetRoot() { return yaml_document_get_root_node(&document_); }

  // The class ID stands in the root's tag, behind the vendor's prefix.
  std::string_view GetClassID() {
    std::string_view tag = reinterpret_cast<const char*>(GetRoot()->tag);
    if (document_.tag_directives.start != document_.tag_directives.end) {
      const std::string_view prefix = reinterpret_cast<const char*>(document_.tag_directives.start->prefix);
      if (tag.starts_with(prefix)) tag.remove_prefix(prefix.size());
    }
    return LeadingNumber(tag);
  }

  // 0-based, in the chunk.
  size_t GetProblemLine() const { return problem_line_; }

 private:
  [[noreturn]] void Fail() {
    // Its loader gives no reason where it could not copy a tag.
    if (parser_.error == YAML_MEMORY_ERROR || parser_.error == YAML_NO_ERROR) throw std::bad_alloc();
    // A byte that is no text is found before lines are counted.
    problem_line_ =
        parser_.error == YAML_READER_ERROR
            ? static_cast<size_t>(std::ranges::count(chunk_.substr(0, parser_.problem_offset), '\n'))
            : parser_.problem_mark.line;
    throw YAMLError(parser_.problem == nullptr ? "unknown problem" : parser_.problem);
  }

  std::string_view chunk_;
  yaml_parser_t parser_ = {};
  yaml_document_t document_ = {};
  bool parser_started_ = false;
  bool loaded_ = false;
  size_t problem_line_ = 0;
};

// A file that holds one as a key of its own could not be told from what is read from the header line.
void RefusePseudoKeys(const YAMLMapping& object) {
  const auto refuse = [](const YAMLMapping::Slot& slot) {
    if (slot.key->IsPseudoKey())
      throw YAMLError("The object holds the reserved key '" + slot.key->GetText() + "'");
  };
  for (const YAMLMapping::Slot& slot : object.GetDuplicatePairs()) refuse(slot);
  if (object.HasDuplicateKeys()) return;
  for (const YAMLMapping::Slot& slot : object) refuse(slot);
}

void Convert(LoadedDocument& document, DocumentConverter converter, std::string_view first_line,
             bool stripped, ReadObject& result) {
  const yaml_node_t* root = document.GetRoot();
  if (root->type != YAML_MAPPING_NODE) throw YAMLError("The object is not a mapping");
  result.object = converter.Convert(document.GetRoot())->AsMapping();
  result.holds_duplicate_keys = converter.FoundDuplicateKeys();
  RefusePseudoKeys(*result.object);
  result.skipped_key_lines = converter.GetSkippedKeyLines();

  result.file_id = YAMLScalar::Lookup(FileIDIn(first_line));
  const auto pairs = static_cast<uint32_t>(root->data.mapping.pairs.top - root->data.mapping.pairs.start);
  AppendPseudoKeys(*result.object, result.file_id, YAMLScalar::Lookup(document.GetClassID()), stripped,
                   pairs);
}

// Whether a line of the header says nothing to libyaml.
bool IsBlankOrComment(std::string_view line) {
  const size_t first = line.find_first_not_of(" \t\r\n");
  return first == std::string_view::npos || line[first] == '#';
}

size_t CountLines(std::string_view text) { return static_cast<size_t>(std::ranges::count(text, '\n')); }

}  // namespace

// Only what libyaml needs, and little of it: it gets the directives again with every document, and a header
// of some megabytes before a million small ones would take hours.
DocumentReader::DocumentReader(std::string_view header, const char* first_line, bool keeps_equal_pairs)
    : file_begin_(first_line), counted_to_(first_line), keeps_equal_pairs_(keeps_equal_pairs) {
  constexpr size_t kMostDirectives = 1024;
  for (size_t begin = 0; begin < header.size();) {
    const size_t line_end = header.find('\n', begin);
    const size_t end = line_end == std::string_view::npos ? header.size() : line_end + 1;
    const std::string_view line = header.substr(begin, end - begin);
    // The document starts on the last line if that has no end.
    if (line_end != std::string_view::npos && IsBlankOrComment(line)) {
      ++dropped_lines_;
    } else {
      directives_ += line;
    }
    begin = end;
  }
  if (directives_.size() > kMostDirectives) throw YAMLError("YAML directives are longer than 1024 bytes");
  kept_lines_ = CountLines(directives_);
}

// Blanks the mark out, which is no YAML.
bool DocumentReader::TakeStrippedMark() {
  constexpr std::string_view kStripped = "stripped";
  const size_t line_end = chunk_.find_first_of("\r\n", directives_.size());
  if (line_end == std::string::npos) throw YAMLError("Error locating end of document sequence");
  if (line_end < kStripped.size()) return false;
  const size_t mark = line_end - kStripped.size();
  if (chunk_.compare(mark, kStripped.size(), kStripped) != 0) return false;
  chunk_.replace(mark, kStripped.size(), kStripped.size(), ' ');
  return true;
}

// The document's own first line, which names the object.
std::string_view DocumentReader::FirstLine() const {
  const std::string_view document = std::string_view(chunk_).substr(directives_.size());
  return document.substr(0, document.find_first_of("\r\n"));
}

bool DocumentReader::ReadChunk(bool last, bool stripped, ReadObject& result, size_t& problem_line) {
  const DocumentLimits before = limits_;
  CheckDocumentLimits(chunk_, directives_.size(), limits_);
  result.counts_for_limits = limits_ != before;
  LoadedDocument loaded;
  try {
    if (!loaded.Load(chunk_)) return false;
    loaded.CheckEnd(last);
    Convert(loaded, DocumentConverter(loaded.Get(), dropped_lines_, keeps_equal_pairs_), FirstLine(),
            stripped, result);
  } catch (const YAMLError&) {
    problem_line = loaded.GetProblemLine();
    throw;
  }
  return true;
}

// 0-based. From the place where it was last asked for: a hostile file may ask for every document's.
size_t DocumentReader::LineOf(std::string_view document) {
  if (document.data() < counted_to_) {
    counted_to_ = file_begin_;
    counted_lines_ = 0;
  }
  counted_lines_ += static_cast<size_t>(std::count(counted_to_, document.data(), '\n'));
  counted_to_ = document.data();
  return counted_lines_;
}

bool DocumentReader::Read(std::string_view document, bool last, ReadObject& result) {
  chunk_ = directives_;
  chunk_ += document;

  // In the chunk the document starts on the line behind the directives, in the file on a line of its own.
  // libyaml counts the end of a text as one line more.
  const auto count_in_file = [&](std::span<size_t> lines) {
    const size_t first = LineOf(document) + 1;
    const size_t end = first + CountLines(document.substr(0, document.size() - 1));
    for (size_t& line : lines) line = std::min(first + (line > kept_lines_ ? line - kept_lines_ : 0), end);
  };
  size_t problem_line = 0;
  try {
    const bool stripped = TakeStrippedMark();
    // With the next document's start libyaml sees where this one ends.
    if (!last) chunk_ += "---";
    if (!ReadChunk(last, stripped, result, problem_line)) return false;
  } catch (const YAMLError& error) {
    count_in_file({&problem_line, 1});
    std::string place = "see line " + std::to_string(problem_line);
    if (const std::string_view file_id = FileIDIn(FirstLine()); !file_id.empty())
      place.append(", object ").append(file_id);
    throw YAMLError(error.what(), std::move(place));
  }
  if (!result.skipped_key_lines.empty()) count_in_file(result.skipped_key_lines);
  return true;
}

}  // namespace vexel_yaml
