#include "yaml/document_reader.h"

#include <yaml.h>

#include <algorithm>
#include <new>

#include "yaml/convert_document.h"
#include "yaml/document_limits.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

std::string_view LeadingNumber(std::string_view text) {
  return text.substr(0, std::min(text.find_first_not_of("0123456789-"), text.size()));
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
  void Fail() {
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

// The pseudo keys count in the hash, so that a change of the class ID or of the stripped mark alone is seen.
void AppendPseudoKey(YAMLMapping& object, const YAMLScalar* key, const YAMLScalar* value, uint32_t position) {
  object.Append(key, value->AsValue());
  uint32_t hash = YAMLNode::Combine(object.GetHash(), key->GetHash());
  hash = YAMLNode::Combine(hash, value->GetHash());
  object.SetHash(YAMLNode::Combine(hash, position));
}

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

void Convert(LoadedDocument& document, std::string_view chunk, bool stripped, ReadObject& result) {
  const yaml_node_t* root = document.GetRoot();
  if (root->type != YAML_MAPPING_NODE) throw YAMLError("The object is not a mapping");
  DocumentConverter converter(document.Get());
  result.object = converter.Convert(document.GetRoot())->AsMapping();
  result.holds_duplicate_keys = converter.FoundDuplicateKeys();
  RefusePseudoKeys(*result.object);
  result.skipped_key_lines = converter.GetSkippedKeyLines();

  const size_t anchor = chunk.find('&');
  result.file_id = YAMLScalar::Lookup(
      anchor == std::string_view::npos ? std::string_view() : LeadingNumber(chunk.substr(anchor + 1)));
  auto position = static_cast<uint32_t>(root->data.mapping.pairs.top - root->data.mapping.pairs.start);
  AppendPseudoKey(*result.object, YAMLScalar::fileIDPlaceHolderName, result.file_id, position++);
  AppendPseudoKey(*result.object, YAMLScalar::classIDPlaceHolderName,
                  YAMLScalar::Lookup(document.GetClassID()), position++);
  if (!stripped) return;
  AppendPseudoKey(*result.object, YAMLScalar::strippedPrefabPlaceHolderName, YAMLScalar::one, position);
}

}  // namespace

// Blanks the mark out, which is no YAML.
bool DocumentReader::TakeStrippedMark() {
  constexpr std::string_view kStripped = "stripped";
  const size_t line_end = chunk_.find_first_of("\r\n", header_.size());
  if (line_end == std::string::npos) throw YAMLError("Error locating end of document sequence");
  if (line_end < kStripped.size()) return false;
  const size_t mark = line_end - kStripped.size();
  if (chunk_.compare(mark, kStripped.size(), kStripped) != 0) return false;
  chunk_.replace(mark, kStripped.size(), kStripped.size(), ' ');
  return true;
}

bool DocumentReader::Read(const AssetText::Document& document, bool last, ReadObject& result) {
  chunk_.resize(header_.size());
  chunk_ += document.text;
  const bool stripped = TakeStrippedMark();
  // With the next document's start libyaml sees where this one ends.
  if (!last) chunk_ += "---";

  // In the chunk the document starts on the line behind the header, in the file on a line of its own. libyaml
  // counts the end of a text as one line more.
  const auto header_lines = static_cast<size_t>(std::count(header_.begin(), header_.end(), '\n'));
  const size_t last_line =
      static_cast<size_t>(std::count(document.text.begin(), document.text.end() - 1, '\n'));
  const auto line_in_file = [&](size_t line) {
    return document.line + 1 + std::min(line > header_lines ? line - header_lines : 0, last_line);
  };
  LoadedDocument loaded;
  try {
    CheckDocumentLimits(chunk_);
    if (!loaded.Load(chunk_)) return false;
    loaded.CheckEnd(last);
    Convert(loaded, chunk_, stripped, result);
  } catch (const YAMLError& error) {
    throw YAMLError(error.what() + (" at line " + std::to_string(line_in_file(loaded.GetProblemLine()))));
  }
  for (size_t& line : result.skipped_key_lines) line = line_in_file(line);
  return true;
}

}  // namespace vexel_yaml
